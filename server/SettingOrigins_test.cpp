// Where settings come from, as a client of the running server sees it.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using http::testing::Wire;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::TestDaemon;

std::string origins(const TestDaemon& daemon) {
  Wire wire(daemon.port());
  wire.send(http::testing::enumeration("EnumerateInstances", "ZORVA_DNSSettingOrigin"));
  return wire.receive().body;
}

std::string property(const std::string& name, const std::string& value) {
  return "<PROPERTY NAME=\"" + name + "\" TYPE=\"string\"><VALUE>" + value + "</VALUE></PROPERTY>";
}

TEST(SettingOrigins, AnInterfaceHasItsOwnerAndTheNameOfItsFile) {
  const TestDaemon daemon;
  daemon.directory().write("tree.json", R"({"system_name":"host1","nodes":[
    {"type":"System","name":"system","description":"Computer","children":[
      {"type":"Port","name":"eth0","description":"","children":[
        {"type":"NetworkIPConfig","name":"ip","description":"","properties":{
          "name":"eth0","dns_owner":"NetworkManager","dns_profile":"lan","dns_server_addresses":["192.0.2.53"]}}]}]}]})");
  EXPECT_THAT(
      origins(daemon),
      AllOf(HasSubstr(property("InstanceID", "Computer%eth0")), HasSubstr(property("Owner", "NetworkManager")),
            HasSubstr(property("OwnerProfile", "lan")), HasSubstr(property("FileName", "ifcfg-eth0")),
            HasSubstr(property("InstanceID", "dnsgen1:host1")), Not(HasSubstr(property("File", "ifcfg-eth0")))));
}

TEST(SettingOrigins, AFileOfSettingsIsNamed) {
  const TestDaemon daemon;
  daemon.directory().write("data/ifcfg-eth0", "DNSSERVERS=192.0.2.1\n");
  EXPECT_THAT(origins(daemon), HasSubstr(property("File", "ifcfg-eth0")));
}

}  // namespace
}  // namespace zorva::server
