// Compares every association of a host with three interfaces and its service processor, which zorva-bmc has read, with
// a table that was written by hand. The provider library and the companions are loaded as a CIM server does it, and
// asked through the broker.

#include <gmock/gmock.h>
#include <stdlib.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "schema/Schema.h"

namespace zorva {
namespace {

using ::testing::UnorderedElementsAreArray;
using Lines = std::vector<std::string>;

constexpr const char* kTree = R"({ "system_name": "host1", "nodes": [
  { "type": "System", "name": "system", "description": "Computer", "children": [
    { "type": "Port", "name": "eth0", "children": [ { "type": "NetworkIPConfig", "name": "ip", "properties": {
      "name": "eth0", "host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org"],
      "dns_server_addresses": ["192.0.2.53", "2001:db8::53"], "protocol_if_type": 4097, "enabled_state": 1,
      "addresses": [ { "address": "192.0.2.10", "prefix_length": 24, "origin": "static" },
                     { "address": "2001:db8::10", "prefix_length": 64, "origin": "slaac" } ] } } ] },
    { "type": "Port", "name": "eth1", "children": [ { "type": "NetworkIPConfig", "name": "ip", "properties": {
      "name": "eth1", "host_name": "host1", "dns_server_addresses": ["192.0.2.53"], "enabled_state": 12,
      "addresses": [ { "address": "198.51.100.7", "prefix_length": 25, "origin": "dhcp" } ] } } ] },
    { "type": "Port", "name": "wlan0", "children": [ { "type": "NetworkIPConfig", "name": "ip", "properties": {
      "name": "wlan0", "enabled_state": 16 } } ] } ] } ] })";

// What zorva-bmc read.
constexpr const char* kBmc = R"({ "read_at": 1, "interval": 60, "problem": "", "nodes": [
  { "type": "System", "name": "bmc.1", "description": "BMC", "children": [
    { "type": "Port", "name": "bmc0", "children": [ { "type": "NetworkIPConfig", "name": "ip", "properties": {
      "name": "bmc0", "host_name": "bmc", "domain_name": "mgmt.example.org", "dns_server_addresses": ["192.0.2.54"],
      "enabled_state": 1,
      "addresses": [ { "address": "192.0.2.20", "prefix_length": 24, "origin": "static" } ] } } ] } ] } ] })";

// The associations of a class: "left end -> right end", each end by its identifying key, and the further properties.
struct Row {
  const char* className;
  const char* left;
  const char* right;
  Lines associations;
  // What Associators of the left ends and of the right ends show, where that is not the pairs above.
  std::optional<Lines> fromLeft = {};
  std::optional<Lines> fromRight = {};
};

const Lines kServersOfHost{"192.0.2.53 -> eth0",   "192.0.2.53 -> eth1",   "192.0.2.53 -> wlan0",
                           "192.0.2.54 -> eth0",   "192.0.2.54 -> eth1",   "192.0.2.54 -> wlan0",
                           "2001:db8::53 -> eth0", "2001:db8::53 -> eth1", "2001:db8::53 -> wlan0"};

const Row kRows[] = {
    // The tree does not say which interface can reach which server, so all are paired.
    {"ZORVA_RemoteAccessAvailableToElement",
     "Antecedent",
     "Dependent",
     {
         "192.0.2.53 -> bmc0 OrderOfAccess=1",
         "192.0.2.53 -> eth0 OrderOfAccess=1",
         "192.0.2.53 -> eth1 OrderOfAccess=1",
         "192.0.2.53 -> wlan0 OrderOfAccess=1",
         "192.0.2.54 -> bmc0 OrderOfAccess=1",
         "192.0.2.54 -> eth0 OrderOfAccess=1",
         "192.0.2.54 -> eth1 OrderOfAccess=1",
         "192.0.2.54 -> wlan0 OrderOfAccess=1",
         "2001:db8::53 -> bmc0 OrderOfAccess=2",
         "2001:db8::53 -> eth0 OrderOfAccess=2",
         "2001:db8::53 -> eth1 OrderOfAccess=2",
         "2001:db8::53 -> wlan0 OrderOfAccess=2",
     },
     // Every server is the host's, and only endpoints of the same system are its far ends.
     kServersOfHost,
     kServersOfHost},
    // By the whole name: the further address eth0_2 has no endpoint of its own.
    {"ZORVA_DNSSAPSAPDependency", "Antecedent", "Dependent", {"eth0 -> eth0", "eth1 -> eth1", "bmc0 -> bmc0"}},
    {"ZORVA_DNSHostedAccessPoint",
     "Antecedent",
     "Dependent",
     {"host1 -> eth0", "host1 -> eth1", "host1 -> wlan0", "BMC:-1 -> bmc0"},
     // Only the host itself is asked for its endpoints.
     Lines{"host1 -> eth0", "host1 -> eth1", "host1 -> wlan0"}},
    // The service processor's name is not in the setting's InstanceID.
    {"ZORVA_DNSGeneralElementSettingData",
     "ManagedElement",
     "SettingData",
     {"host1 -> dnsgen1:host1 IsCurrent=1 IsDefault=1"},
     std::nullopt,
     Lines{"host1 -> dnsgen1:host1", "BMC:-1 -> dnsgen1:host1"}},
    {"ZORVA_DNSGenEndPointElementSettingData",
     "ManagedElement",
     "SettingData",
     {"bmc0 -> dnsgen1:host1 IsCurrent=1 IsDefault=1", "eth0 -> dnsgen1:host1 IsCurrent=1 IsDefault=1",
      "eth1 -> dnsgen1:host1 IsCurrent=1 IsDefault=1", "wlan0 -> dnsgen1:host1 IsCurrent=1 IsDefault=1"}},
    {"ZORVA_DNSEndPointElementSettingData",
     "ManagedElement",
     "SettingData",
     {"bmc0 -> BMC%bmc0 IsCurrent=2 IsDefault=2", "eth0 -> Computer%eth0 IsCurrent=2 IsDefault=2",
      "eth1 -> Computer%eth1 IsCurrent=2 IsDefault=2", "wlan0 -> Computer%wlan0 IsCurrent=2 IsDefault=2"}},
    {"ZORVA_DNSGenOrderedComponent",
     "GroupComponent",
     "PartComponent",
     {"Computer%eth0%ipv4 -> dnsgen1:host1 AssignedSequence=1",
      "Computer%eth0%ipv6 -> dnsgen1:host1 AssignedSequence=1",
      "Computer%eth1%ipv4 -> dnsgen1:host1 AssignedSequence=1", "BMC%bmc0%ipv4 -> dnsgen1:host1 AssignedSequence=1"}},
    {"ZORVA_DNSOrderedComponent",
     "GroupComponent",
     "PartComponent",
     {"Computer%eth0%ipv4 -> Computer%eth0 AssignedSequence=2",
      "Computer%eth0%ipv6 -> Computer%eth0 AssignedSequence=2",
      "Computer%eth1%ipv4 -> Computer%eth1 AssignedSequence=2", "BMC%bmc0%ipv4 -> BMC%bmc0 AssignedSequence=2"}},
};

std::string nameOf(const broker::ObjectPath& path) {
  for (const char* key : {"InstanceID", "Name"}) {
    if (path.key(key) != nullptr) return std::string(path.key(key)->asText());
  }
  return "?";
}

const broker::ObjectPath* pathOf(const broker::Value* end) {
  if (end == nullptr || !std::holds_alternative<broker::Boxed<broker::ObjectPath>>(end->scalar)) return nullptr;
  return &*std::get<broker::Boxed<broker::ObjectPath>>(end->scalar);
}

std::string nameOf(const broker::Value* end) { return pathOf(end) == nullptr ? "?" : nameOf(*pathOf(end)); }

class AssociationTable : public ::testing::TestWithParam<Row> {
 protected:
  static void SetUpTestSuite() {
    directory_ = std::filesystem::temp_directory_path() / ("zorva-associations-" + std::to_string(::getpid()));
    std::filesystem::create_directories(directory_ / "data");
    std::ofstream(directory_ / "tree.json") << kTree;
    std::ofstream(directory_ / "bmc.json") << kBmc;
    std::ofstream(directory_ / "agent.toml")
        << "[agent]\ndata_dir = \"" << (directory_ / "data").string() << "/\"\n[tree]\nsource = \"file\"\nfile = \""
        << (directory_ / "tree.json").string() << "\"\n[bmc]\nfile = \"" << (directory_ / "bmc.json").string()
        << "\"\n[log]\ntarget = \"off\"\n";
    ::setenv("ZORVAGENT_CONFIG", (directory_ / "agent.toml").c_str(), 1);
    broker::BrokerOptions options;
    options.providerDirectory = ZORVA_LIB_DIR;
    broker_ = std::make_unique<broker::Broker>(schema::loadBuiltInClasses(schema::ClassSet::Profile), options);
  }
  static void TearDownTestSuite() {
    broker_.reset();
    std::filesystem::remove_all(directory_);
  }

  static std::string lineOf(const broker::Instance& association) {
    std::string line = nameOf(association.property(GetParam().left));
    line += " -> " + nameOf(association.property(GetParam().right));
    for (const char* name : {"OrderOfAccess", "IsCurrent", "IsDefault", "AssignedSequence"}) {
      const broker::Value* value = association.property(name);
      if (value == nullptr || value->isNull) continue;
      line += std::string(" ") + name + "=" + std::to_string(std::get<std::uint64_t>(value->scalar));
    }
    return line;
  }
  static std::string lineOf(const broker::ObjectPath& association) {
    return nameOf(association.key(GetParam().left)) + " -> " + nameOf(association.key(GetParam().right));
  }
  static Lines pairs() {
    Lines lines;
    for (const std::string& line : GetParam().associations) {
      lines.push_back(line.substr(0, line.find(' ', line.find(" -> ") + 4)));
    }
    return lines;
  }

  // The objects at that end, each once.
  static std::vector<broker::ObjectPath> ends(const char* end) {
    std::map<std::string, broker::ObjectPath> found;
    broker_->enumerateInstanceNames("root/cimv2", GetParam().className, [&](const broker::ObjectPath& association) {
      if (const broker::ObjectPath* path = pathOf(association.key(end))) found.emplace(nameOf(*path), *path);
      return true;
    });
    std::vector<broker::ObjectPath> paths;
    for (const auto& [name, path] : found) paths.push_back(path);
    return paths;
  }

  // "left -> right" for each object at one end and what is associated with it.
  static Lines associatedFrom(const char* from, const char* to) {
    Lines lines;
    for (const broker::ObjectPath& path : ends(from)) {
      broker_->associatorNames(path, {GetParam().className, {}, from, to}, [&](const broker::ObjectPath& other) {
        const std::string names[] = {nameOf(path), nameOf(other)};
        const bool isLeft = from == GetParam().left;
        lines.push_back(names[isLeft ? 0 : 1] + " -> " + names[isLeft ? 1 : 0]);
        return true;
      });
    }
    return lines;
  }

  static inline std::filesystem::path directory_;
  static inline std::unique_ptr<broker::Broker> broker_;
};

INSTANTIATE_TEST_SUITE_P(Of, AssociationTable, ::testing::ValuesIn(kRows),
                         [](const auto& row) { return std::string(row.param.className).substr(6); });

TEST_P(AssociationTable, IsWhatInstancesShow) {
  Lines lines;
  const broker::Status status =
      broker_->enumerateInstances("root/cimv2", GetParam().className, {}, [&](const broker::Instance& association) {
        lines.push_back(lineOf(association));
        return true;
      });
  EXPECT_TRUE(status.ok()) << status.message;
  EXPECT_THAT(lines, UnorderedElementsAreArray(GetParam().associations));
}

TEST_P(AssociationTable, IsWhatNamesShow) {
  Lines lines;
  const broker::Status status =
      broker_->enumerateInstanceNames("root/cimv2", GetParam().className, [&](const broker::ObjectPath& association) {
        lines.push_back(lineOf(association));
        return true;
      });
  EXPECT_TRUE(status.ok()) << status.message;
  EXPECT_THAT(lines, UnorderedElementsAreArray(pairs()));
}

// Each association is fetched by its name in the enumeration.
TEST_P(AssociationTable, EachIsFoundByItsName) {
  std::vector<broker::ObjectPath> paths;
  broker_->enumerateInstanceNames("root/cimv2", GetParam().className, [&](const broker::ObjectPath& association) {
    paths.push_back(association);
    return true;
  });
  Lines lines;
  for (const broker::ObjectPath& path : paths) {
    const auto association = broker_->getInstance(path, {});
    ASSERT_TRUE(association) << association.error().message;
    lines.push_back(lineOf(*association));
  }
  EXPECT_THAT(lines, UnorderedElementsAreArray(GetParam().associations));
}

TEST_P(AssociationTable, IsWhatAssociatorsOfBothEndsShow) {
  const Row& row = GetParam();
  EXPECT_THAT(associatedFrom(row.left, row.right), UnorderedElementsAreArray(row.fromLeft.value_or(pairs())));
  EXPECT_THAT(associatedFrom(row.right, row.left), UnorderedElementsAreArray(row.fromRight.value_or(pairs())));
}

}  // namespace
}  // namespace zorva
