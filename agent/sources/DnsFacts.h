#pragma once

// What is known of the DNS settings of an interface, or of the host.

#include <optional>
#include <string>
#include <string_view>

#include "agent/tree/Node.h"

namespace zorva::agent {

enum class DnsOrigin { Unknown, Static, Learned, Mixed };

struct DnsFacts {
  std::string owner;    ///< the name of the program, or the path of the file, that the lists are from
  std::string profile;  ///< the profile or file of the owner's that holds them
  DnsOrigin origin = DnsOrigin::Unknown;

  StringList servers;         ///< addresses, in search order
  StringList serversInFull;   ///< with port and name of each, "192.0.2.1:853#dns.example.org"; empty where none has any
  StringList suffixes;        ///< that are appended to names
  StringList routingDomains;  ///< that are asked for here and are no suffixes; "." is every name
  std::string domain;

  std::optional<bool> defaultRoute;
  /// In resolved.conf(5)'s words: "yes", "no", "opportunistic", "allow-downgrade", "resolve". Empty is not known.
  std::string dnsOverTls;
  std::string dnssec;
  std::string llmnr;
  std::string multicastDns;

  bool saysAnything() const { return !servers.empty() || !suffixes.empty() || !routingDomains.empty(); }
};

/// Of one list of servers or domains; what an owner says beyond that is left out.
inline constexpr std::size_t kMostDnsValues = 256;

/// Whether a domain that an owner names can be shown: at most 253 bytes of UTF-8 in labels of at most 63, no blanks, no
/// control characters, no empty label but the one after a final dot, no "~" in front. "." is a domain.
bool isDomain(std::string_view name);

/// Whether a text such as a profile's name can be shown: at most 255 bytes of UTF-8 and no control characters.
bool isShownText(std::string_view text);

/// Collects the servers and domains of one interface. What is wrong or too much is left out and remembered.
class DnsFactsBuilder {
 public:
  explicit DnsFactsBuilder(DnsFacts& facts) : facts_(facts) {}

  /// An address of 4 or 16 bytes; a link-local one gets the interface's name as its zone. Port 0 is the usual one.
  void addServer(const std::vector<unsigned char>& address, const std::string& interface, unsigned int port = 0,
                 const std::string& name = {});
  /// An address as text.
  void addServer(const std::string& address, const std::string& interface);

  /// "~" in front marks one that is no suffix.
  void addDomain(const std::string& domain);
  void addDomain(const std::string& domain, bool routingOnly);

  void setProfile(const std::string& name);

  /// What was left out, in words; empty where nothing was.
  const std::string& problem() const { return problem_; }

 private:
  void leaveOut(const std::string& problem);

  DnsFacts& facts_;
  std::string problem_;
};

}  // namespace zorva::agent
