#pragma once

// What systemd-networkd says.

#include <map>
#include <string>
#include <vector>

#include "agent/sources/DnsOwner.h"
#include "agent/tree/Json.h"

namespace zorva::agent {

/// org.freedesktop.network1(5): one call describes all links as JSON, with the source of each server and domain. (The
/// files of /run/systemd/netif/links/ say at their top that nobody is to parse them, have no sources, and stay when it
/// ends.) It signals the states of links; another server or domain from a lease is noticed by the directory of these
/// files.
class Networkd : public DnsOwner {
 public:
  /// root is put before the directory's path; for tests.
  explicit Networkd(const std::string& root);

  const DnsFacts* factsOf(const Link& link) const override;

 protected:
  bool isConcernedBy(const std::vector<Link>&) const override { return false; }  ///< it signals new links
  void startAsking(const std::vector<Link>& links) override;
  void takeAnswers() override;
  void forget() override;

 private:
  void readDescription(BusReader& reader);
  void readLink(const JsonValue& link);

  std::map<unsigned int, DnsFacts> answer_;  ///< by the link's index, while it is being asked
  std::map<unsigned int, DnsFacts> facts_;
};

}  // namespace zorva::agent
