#pragma once

// What systemd-resolved says.

#include <map>
#include <string>
#include <vector>

#include "agent/sources/DnsOwner.h"

namespace zorva::agent {

/// org.freedesktop.resolve1(5). Two properties of its manager have the servers and domains of all links; the modes of a
/// link are asked for link by link, of the links with servers or domains and of up to 256 others.
///
/// It signals some changes only. The others are noticed by the directory in which it keeps what was set at run time.
class Resolved : public DnsOwner {
 public:
  /// root is put before the directory's path; for tests.
  explicit Resolved(const std::string& root);

  const DnsFacts* factsOf(const Link& link) const override;

  /// What belongs to the host and to no link, or null where it says nothing.
  const DnsFacts* hostFacts() const;

 protected:
  bool isConcernedBy(const std::vector<Link>& links) const override;
  void startAsking(const std::vector<Link>& links) override;
  void takeAnswers() override;
  void forget() override;

 private:
  struct Domain {
    std::string name;
    bool routingOnly = false;
  };
  struct Server {
    std::vector<unsigned char> address;
    unsigned int port = 0;
    std::string name;
  };
  /// Of one link, or of the host.
  struct Said {
    std::vector<Server> servers;
    std::vector<Domain> domains;
    DnsFacts modes;
  };

  void readManager(BusReader& reader);
  void askForLink(int index);
  void readServers(BusReader& reader);
  void readDomains(BusReader& reader);
  DnsFacts factsFrom(const Said& said, const std::string& interface);

  std::map<int, std::string> links_;  ///< that it was asked with: names by index
  std::map<int, Said> said_;          ///< by index, 0 for the host; while it is being asked
  std::map<int, DnsFacts> facts_;
};

}  // namespace zorva::agent
