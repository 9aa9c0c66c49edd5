#include "host/HostObjects.h"

#include <systemd/sd-id128.h>

#include <array>
#include <set>
#include <string_view>

#include "agent/interface/PlatformUtilities.h"
#include "host/SubnetMask.h"
#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::host {

namespace {

constexpr const char* kComputerSystemClass = "ZORVA_ComputerSystem";
constexpr const char* kServiceProcessorClass = "ZORVA_SPComputerSystem";
constexpr const char* kIPEndpointClass = "ZORVA_IPProtocolEndpoint";
constexpr const char* kIPAssignmentClass = "ZORVA_IPAssignmentSettingData";
constexpr const char* kServiceProcessorName = "BMC:-1";

// Values of CIM's enumerations.
constexpr std::uint16_t kEnabled = 2;
constexpr std::uint16_t kDisabled = 3;
constexpr std::uint16_t kNotApplicable = 5;
constexpr std::uint16_t kEnabledButOffline = 6;
constexpr std::uint16_t kRequestNotApplicable = 12;
constexpr std::uint16_t kStatusUnknown = 0;
constexpr std::uint16_t kStatusOk = 2;
constexpr std::uint16_t kNotDedicated = 0;
constexpr std::uint16_t kManagementController = 28;
constexpr std::uint16_t kIPv4 = 4096;
constexpr std::uint16_t kIPv6 = 4097;

// The first line of a small file; empty if it cannot be read.
std::string firstLine(const char* path) {
  constexpr std::size_t kLargestFile = 4096;
  const std::string text = util::readFile(path, kLargestFile).text;
  return std::string(util::trimmedEnd(std::string_view(text).substr(0, text.find('\n')), util::kWhiteSpace));
}

// A name for this machine that is the same at every start and does not reveal the machine's id, which must not leave
// the host; empty if the machine has no id.
std::string machineName() {
  // SD_ID128_MAKE is not valid C++.
  constexpr sd_id128_t kApplication = {
      {0x5c, 0x3b, 0x0e, 0x8d, 0x2a, 0x94, 0x4f, 0x61, 0x9d, 0x77, 0x1b, 0xc8, 0x40, 0xe6, 0x52, 0x9f}};
  sd_id128_t id;
  if (sd_id128_get_machine_app_specific(kApplication, &id) < 0) return {};
  std::array<char, SD_ID128_STRING_MAX> text{};
  return sd_id128_to_string(id, text.data());
}

HostObject hostSystem(const std::string& name) {
  std::vector<std::string> identifiers;
  std::vector<std::string> descriptions;
  const auto identify = [&](const std::string& value, const char* what) {
    if (value.empty()) return;
    identifiers.push_back(value);
    descriptions.emplace_back(what);
  };
  identify(firstLine("/sys/class/dmi/id/product_serial"), "Serial number of the system (SMBIOS)");
  identify(machineName(), "Hash of the machine id");
  return {kComputerSystemClass,
          {{"CreationClassName", std::string(kComputerSystemClass)}, {"Name", name}},
          {{"NameFormat", std::string("IP")},
           {"ElementName", name},
           {"Caption", std::string("Computer system")},
           {"EnabledState", kEnabled},
           {"RequestedState", kRequestNotApplicable},
           {"OperationalStatus", std::vector<std::uint16_t>{kStatusOk}},
           {"Dedicated", std::vector<std::uint16_t>{kNotDedicated}},
           {"OtherIdentifyingInfo", identifiers},
           {"IdentifyingDescriptions", descriptions}}};
}

HostObject serviceProcessor() {
  return {kServiceProcessorClass,
          {{"CreationClassName", std::string(kServiceProcessorClass)}, {"Name", std::string(kServiceProcessorName)}},
          {{"NameFormat", std::string("Other")},
           {"ElementName", std::string("Service processor")},
           {"Caption", std::string("Service processor")},
           {"EnabledState", kNotApplicable},
           {"RequestedState", kRequestNotApplicable},
           {"OperationalStatus", std::vector<std::uint16_t>{kStatusUnknown}},
           {"Dedicated", std::vector<std::uint16_t>{kManagementController}}}};
}

// One interface of the tree and its owning system.
struct Interface {
  const agent::Node& config;
  std::string name;
  bool onServiceProcessor;
};

// Every interface in tree order. An interface without a name gets the name of its port.
std::vector<Interface> interfaces(const agent::TreeSnapshot& tree) {
  std::vector<Interface> found;
  for (const agent::Node* node = tree.nextOfType(agent::NodeType::NetworkIPConfig, 0); node != nullptr;
       node = tree.nextOfType(agent::NodeType::NetworkIPConfig, node->index() + 1)) {
    const agent::Node& port = tree.parent(*node);
    const std::string* name = node->text(ZV::NodeLexicon::PROP_NAME);
    found.push_back({*node, name != nullptr ? *name : port.name(), tree.parent(port).isServiceProcessor()});
  }
  return found;
}

std::uint16_t enabledState(const agent::Node& config) {
  const unsigned int* state = config.number(ZV::NodeLexicon::PROP_ENABLED_STATE);
  if (state == nullptr) return kNotApplicable;
  switch (*state) {
    case 1:
      return kEnabled;
    case 12:
      return kEnabledButOffline;
    case 16:
      return kDisabled;
    default:
      return kNotApplicable;
  }
}

std::uint16_t addressOrigin(const agent::InterfaceAddress& address) {
  const bool isIPv4 = address.family() == agent::AddressFamily::IPv4;
  switch (address.origin) {
    case agent::AddressOrigin::Static:
      return 3;
    case agent::AddressOrigin::Dhcp:
      return isIPv4 ? 4 : 7;
    case agent::AddressOrigin::Slaac:
      return 8;
    case agent::AddressOrigin::LinkLocal:
      return isIPv4 ? 6 : 10;
    case agent::AddressOrigin::Unknown:
      break;
  }
  return 0;
}

HostObject ipEndpoint(const Interface& interface, const agent::InterfaceAddress& address, const std::string& name,
                      const std::string& systemName) {
  HostObject object{kIPEndpointClass,
                    {{"SystemCreationClassName",
                      std::string(interface.onServiceProcessor ? kServiceProcessorClass : kComputerSystemClass)},
                     {"CreationClassName", std::string(kIPEndpointClass)},
                     {"SystemName", interface.onServiceProcessor ? std::string(kServiceProcessorName) : systemName},
                     {"Name", name}},
                    {{"ElementName", name},
                     {"Caption", "IP endpoint of " + interface.name},
                     {"NameFormat", std::string("NICName")},
                     {"AddressOrigin", addressOrigin(address)},
                     {"EnabledState", enabledState(interface.config)},
                     {"RequestedState", kRequestNotApplicable}}};
  if (address.family() == agent::AddressFamily::IPv4) {
    object.properties.push_back({"ProtocolIFType", kIPv4});
    object.properties.push_back({"IPv4Address", address.address});
    object.properties.push_back({"SubnetMask", subnetMask(address.prefixLength)});
  } else {
    object.properties.push_back({"ProtocolIFType", kIPv6});
    object.properties.push_back({"IPv6Address", address.address});
    object.properties.push_back({"PrefixLength", static_cast<std::uint8_t>(address.prefixLength)});
    object.properties.push_back({"IPv6SubnetPrefixLength", static_cast<std::uint16_t>(address.prefixLength)});
  }
  return object;
}

HostObject ipAssignment(const std::string& instanceID, const Interface& interface,
                        const agent::InterfaceAddress& address) {
  const bool isIPv4 = address.family() == agent::AddressFamily::IPv4;
  return {kIPAssignmentClass,
          {{"InstanceID", instanceID}},
          {{"ElementName", interface.name + (isIPv4 ? " IPv4" : " IPv6")},
           {"Caption", std::string("IP assignment")},
           {"AddressOrigin", addressOrigin(address)},
           {"ProtocolIFType", isIPv4 ? kIPv4 : kIPv6}}};
}

}  // namespace

std::vector<HostObject> computerSystems(const agent::TreeSnapshot& tree) {
  std::vector<HostObject> objects = {hostSystem(ZV::getSystemName())};
  for (const agent::Node& node : tree.nodes()) {
    if (!node.isServiceProcessor()) continue;
    objects.push_back(serviceProcessor());
    break;  // otherwise several would share one name
  }
  return objects;
}

std::vector<HostObject> ipEndpoints(const agent::TreeSnapshot& tree) {
  const std::vector<Interface> all = interfaces(tree);
  std::set<std::string> names;
  for (const Interface& interface : all) names.insert(interface.name);

  std::vector<HostObject> objects;
  const std::string systemName = ZV::getSystemName();
  std::set<std::string> begun;  // interfaces whose first address already has the plain name
  for (const Interface& interface : all) {
    unsigned int ordinal = 1;
    for (const agent::InterfaceAddress& address : interface.config.addresses()) {
      std::string name = interface.name;
      if (!begun.insert(interface.name).second) {
        do {
          name = interface.name + "_" + std::to_string(++ordinal);
        } while (!names.insert(name).second);
      }
      objects.push_back(ipEndpoint(interface, address, name, systemName));
    }
  }
  return objects;
}

std::vector<HostObject> ipAssignments(const agent::TreeSnapshot& tree) {
  std::vector<HostObject> objects;
  std::set<std::string> known;
  for (const Interface& interface : interfaces(tree)) {
    const std::string prefix = (interface.onServiceProcessor ? "BMC%" : "Computer%") + interface.name;
    for (const agent::InterfaceAddress& address : interface.config.addresses()) {
      const std::string instanceID = prefix + (address.family() == agent::AddressFamily::IPv4 ? "%ipv4" : "%ipv6");
      // The first address of each version determines the origin.
      if (known.insert(instanceID).second) objects.push_back(ipAssignment(instanceID, interface, address));
    }
  }
  return objects;
}

}  // namespace zorva::host
