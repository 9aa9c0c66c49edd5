#pragma once

// A node of the instrumentation tree, with its properties by number.

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "agent/interface/AgentApi.h"
#include "agent/interface/NodeLexicon.h"

namespace zorva::agent {

/// The type of a node. The interface headers know only the last one; cursors reach the others by path.
enum class NodeType : unsigned int {
  Root = 0,
  System = 1,  ///< a computer, or the service processor of one
  Port = 2,    ///< a network interface
  NetworkIPConfig = ZV::NodeLexicon::NODE_NETWORK_IP_CONFIG,
};

/// The numbers of the interface headers, and those that only the agent's own readers see.
using PropertyNumber = unsigned int;
inline constexpr PropertyNumber kAddresses = 0x10001;  ///< the interface's IP addresses, an AddressList

/// About the DNS settings of an interface. The system's node has those of the host that belong to no interface, with
/// their servers and suffixes under the numbers of the interface headers.
inline constexpr PropertyNumber kDnsOwner = 0x10002;           ///< text: the program or file that says so
inline constexpr PropertyNumber kDnsProfile = 0x10003;         ///< text: the profile or file of that program's
inline constexpr PropertyNumber kDnsOrigin = 0x10004;          ///< text: "static", "learned", or "mixed" of both
inline constexpr PropertyNumber kDnsServersInFull = 0x10005;   ///< list: with port and name, where any has one
inline constexpr PropertyNumber kDnsRoutingDomains = 0x10006;  ///< list: asked for here, and no suffixes
inline constexpr PropertyNumber kDnsDefaultRoute = 0x10007;    ///< text: "yes" or "no"
inline constexpr PropertyNumber kDnsOverTls = 0x10008;         ///< text: "yes", "opportunistic" or "no"
inline constexpr PropertyNumber kDnssec = 0x10009;             ///< text: "yes", "allow-downgrade" or "no"
inline constexpr PropertyNumber kLlmnr = 0x1000A;              ///< text: "yes", "resolve" or "no"
inline constexpr PropertyNumber kMulticastDns = 0x1000B;       ///< text: "yes", "resolve" or "no"

/// About the resolver of the host's programs, on the system's node: what the C library makes of /etc/resolv.conf.
inline constexpr PropertyNumber kResolverServers = 0x1000C;   ///< list: that are asked
inline constexpr PropertyNumber kResolverNotAsked = 0x1000D;  ///< list: servers beyond those that are asked
inline constexpr PropertyNumber kResolverSearch = 0x1000E;    ///< list
inline constexpr PropertyNumber kResolverOptions = 0x1000F;   ///< list: "ndots:2", "rotate"

/// About what was read from a service processor, on its system's node.
inline constexpr PropertyNumber kReadAt = 0x10010;        ///< number: seconds since 1970
inline constexpr PropertyNumber kReadInterval = 0x10011;  ///< number: seconds from one reading to the next
inline constexpr PropertyNumber kReadProblem = 0x10012;   ///< text: why the latest reading failed

/// Raw enabled states, as in PROP_ENABLED_STATE.
inline constexpr unsigned int kRawUpWithCarrier = 1;
inline constexpr unsigned int kRawUpWithoutCarrier = 12;
inline constexpr unsigned int kRawDown = 16;

/// The owner of the DNS settings of a service processor's interfaces.
inline constexpr const char* kBmcOwner = "BMC";

/// The origin of an address, from the kernel's flags and protocol of the address.
enum class AddressOrigin : std::uint8_t { Unknown, Static, Dhcp, Slaac, LinkLocal };

enum class AddressFamily : std::uint8_t { IPv4, IPv6 };

struct InterfaceAddress {
  std::string address;  ///< in the text format of inet_ntop
  unsigned int prefixLength = 0;
  AddressOrigin origin = AddressOrigin::Unknown;

  AddressFamily family() const {
    return address.find(':') == std::string::npos ? AddressFamily::IPv4 : AddressFamily::IPv6;
  }
  bool operator==(const InterfaceAddress&) const = default;
};

using StringList = std::vector<std::string>;
using AddressList = std::vector<InterfaceAddress>;

/// Lists are shared: every interface of a host has the same servers.
using SharedStrings = std::shared_ptr<const StringList>;
using SharedAddresses = std::shared_ptr<const AddressList>;
using PropertyValue = std::variant<unsigned int, std::string, SharedStrings, SharedAddresses>;

struct Property {
  PropertyNumber number = 0;
  PropertyValue value;
  bool overlaid = false;  ///< the value was set through the agent and replaces the source's own
};

/// Whether two values are of one type and equal, lists by their elements.
ZORVA_AGENT_API bool equalValues(const PropertyValue& left, const PropertyValue& right);

/// A node is part of one immutable TreeSnapshot and lives as long as it; any thread may read it.
class ZORVA_AGENT_API Node {
 public:
  NodeType type() const { return type_; }

  /// Bytes as the host gives them: no "/", no NUL, empty only for the root; different from those of its siblings.
  const std::string& name() const { return name_; }

  /// The names from the root down, each with a "/" before it; "/" for the root.
  const std::string& path() const { return path_; }

  const std::string& description() const { return description_; }

  /// True for the node of a service processor.
  bool isServiceProcessor() const { return type_ == NodeType::System && description_ == "BMC"; }

  /// The index of this node and of its parent in TreeSnapshot::nodes(); the root is its own parent.
  std::size_t index() const { return index_; }
  std::size_t parentIndex() const { return parentIndex_; }

  const std::vector<Property>& properties() const { return properties_; }

  /// The property, or null if the node has none with that number.
  const Property* find(PropertyNumber number) const;

  /// The value of a property, or null if the node lacks it or has it with another type.
  const std::string* text(PropertyNumber number) const;
  const unsigned int* number(PropertyNumber number) const;
  const StringList* list(PropertyNumber number) const;

  /// The same, or an empty one.
  const std::string& textOrEmpty(PropertyNumber number) const;
  const StringList& listOrEmpty(PropertyNumber number) const;

  /// The addresses of the interface, in the kernel's order; empty if none are known.
  const AddressList& addresses() const;

 private:
  friend class TreeBuilder;

  NodeType type_ = NodeType::Root;
  std::size_t index_ = 0;
  std::size_t parentIndex_ = 0;
  std::string name_;
  std::string path_;
  std::string description_;
  std::vector<Property> properties_;
};

}  // namespace zorva::agent
