#pragma once

// What NetworkManager says.

#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "agent/sources/DnsOwner.h"

namespace zorva::agent {

/// NetworkManager's D-Bus interface. One call has all its objects: devices, their IP configurations and their active
/// connections. Then each profile that is in use is asked which servers and domains it has itself: those were set by
/// hand, the others were learned.
///
/// It speaks for the devices that it manages with a profile, and not for those that somebody else has set up and that
/// it only follows ("connected (externally)").
class NetworkManager : public DnsOwner {
 public:
  NetworkManager();

  const DnsFacts* factsOf(const Link& link) const override;

 protected:
  bool isConcernedBy(const std::vector<Link>&) const override { return false; }  ///< it signals new devices
  void startAsking(const std::vector<Link>& links) override;
  void takeAnswers() override;
  void forget() override;

 private:
  struct Device {
    std::string interface;
    std::string ipInterface;
    std::string active;  ///< paths
    std::string ip4;
    std::string ip6;
    bool managed = false;
  };
  struct IpConfig {
    StringList servers;
    StringList searches;
    StringList domains;
  };
  struct Active {
    std::string name;
    std::string profile;  ///< its path
    bool external = false;
  };
  struct Profile {
    bool known = false;
    StringList servers;
    StringList searches;
  };
  struct Objects {
    std::vector<Device> devices;
    std::map<std::string, IpConfig> ipConfigs;
    std::map<std::string, Active> actives;
    std::map<std::string, Profile> profiles;  ///< those that are in use
  };

  void readObjects(BusReader& reader);
  void readObject(BusReader& reader, const std::string& path, const std::string& interface);
  static Device readDevice(BusReader& reader);
  static IpConfig readIpConfig(BusReader& reader);
  static Active readActive(BusReader& reader);
  static void readProfile(BusReader& reader, Profile& profile);
  void askForProfiles();
  void takeDevice(const Device& device);

  Objects objects_;                                  ///< while it is being asked
  std::unordered_map<std::string, DnsFacts> facts_;  ///< by the interface's name
};

}  // namespace zorva::agent
