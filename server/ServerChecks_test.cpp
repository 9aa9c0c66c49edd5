// What DNS servers answer, as a client of the running server sees it.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "dns/testing/UdpServer.h"
#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using dns::testing::UdpServer;
using http::testing::Wire;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::TestDaemon;

std::string checks(const TestDaemon& daemon, const std::string& className) {
  Wire wire(daemon.port());
  wire.send(http::testing::enumeration("EnumerateInstances", className));
  return wire.receive().body;
}
std::string serverChecks(const TestDaemon& daemon) { return checks(daemon, "ZORVA_DNSServerCheck"); }

std::string text(const std::string& name, const std::string& value) {
  return "<PROPERTY NAME=\"" + name + "\" TYPE=\"string\"><VALUE>" + value + "</VALUE></PROPERTY>";
}
std::string truth(const std::string& name, const std::string& value) {
  return "<PROPERTY NAME=\"" + name + "\" TYPE=\"boolean\"><VALUE>" + value + "</VALUE></PROPERTY>";
}

/// An interface whose servers these are.
void writeTree(const TestDaemon& daemon, const std::string& servers, const std::string& suffix = "example.org") {
  daemon.directory().write("tree.json", R"({"system_name":"host1","nodes":[
    {"type":"System","name":"system","description":"Computer","children":[
      {"type":"Port","name":"eth0","description":"","children":[
        {"type":"NetworkIPConfig","name":"ip","description":"","properties":{
          "name":"eth0","dns_suffixes":[")" +
                                            suffix + R"("],"dns_server_addresses":["127.0.0.1"],
          "dns_servers_in_full":[)" + servers +
                                            "]}}]}]}]}");
}

std::string textOf(const UdpServer& server) { return "127.0.0.1:" + std::to_string(server.port()); }
void writeTree(const TestDaemon& daemon, const UdpServer& server, const std::string& suffix = "example.org") {
  writeTree(daemon, "\"" + textOf(server) + "\"", suffix);
}

TEST(ServerChecks, AServerThatAnswersIsGood) {
  const UdpServer server("127.0.0.1", 0, UdpServer::answering());
  const TestDaemon daemon;
  writeTree(daemon, server);
  EXPECT_THAT(serverChecks(daemon), AllOf(HasSubstr(text("Server", textOf(server))),
                                          HasSubstr(text("Answer", "NOERROR")), HasSubstr(truth("IsGood", "TRUE")),
                                          HasSubstr("<PROPERTY NAME=\"ResponseTime\" TYPE=\"uint64\"><VALUE>"),
                                          HasSubstr("<VALUE.ARRAY><VALUE>eth0</VALUE></VALUE.ARRAY>"),
                                          HasSubstr("<PROPERTY NAME=\"UserCount\" TYPE=\"uint64\"><VALUE>1</VALUE>")));
}

TEST(ServerChecks, AServerThatRefusesIsNotGood) {
  const UdpServer server("127.0.0.1", 0, UdpServer::answering(5));
  const TestDaemon daemon;
  writeTree(daemon, server);
  EXPECT_THAT(serverChecks(daemon), AllOf(HasSubstr(text("Answer", "REFUSED")), HasSubstr(truth("IsGood", "FALSE"))));
}

TEST(ServerChecks, AServerThatWasSetIsAskedAndTheOwnersIsNot) {
  const UdpServer owners("127.0.0.1", 0, UdpServer::answering());
  const TestDaemon daemon;
  writeTree(daemon, owners);
  daemon.directory().write("data/ifcfg-eth0", "DNSSERVERS=127.0.0.253 \n");
  EXPECT_THAT(serverChecks(daemon),
              AllOf(HasSubstr(text("Server", "127.0.0.253")),
                    HasSubstr(text("Answer", "unreachable: Connection refused")), HasSubstr(truth("IsGood", "FALSE")),
                    Not(HasSubstr("\"ResponseTime\" TYPE=\"uint64\"><VALUE>")), Not(HasSubstr(textOf(owners)))));
  EXPECT_EQ(owners.queries(), 0);
}

TEST(ServerChecks, ASuffixResolvesOrDoesNot) {
  const UdpServer server("127.0.0.1", 0, UdpServer::answering());
  const UdpServer ignorant("127.0.0.1", 0, UdpServer::answering(3));
  const TestDaemon daemon;
  writeTree(daemon, server);
  EXPECT_THAT(checks(daemon, "ZORVA_DNSSuffixCheck"),
              AllOf(HasSubstr(text("Suffix", "example.org")), HasSubstr(truth("Resolves", "TRUE"))));
  writeTree(daemon, ignorant, "example.net");
  EXPECT_THAT(checks(daemon, "ZORVA_DNSSuffixCheck"),
              AllOf(HasSubstr(text("Suffix", "example.net")), HasSubstr(truth("Resolves", "FALSE"))));
}

TEST(ServerChecks, AnAnswerCountsForAWhileAndNewServersAreAskedAtOnce) {
  const UdpServer first("127.0.0.1", 0, UdpServer::answering());
  const UdpServer second("127.0.0.1", 0, UdpServer::answering());
  const TestDaemon daemon;
  writeTree(daemon, first);
  serverChecks(daemon);
  const int asked = first.queries();
  EXPECT_EQ(asked, 2);  // for the root, and for the suffix
  serverChecks(daemon);
  checks(daemon, "ZORVA_DNSSuffixCheck");
  EXPECT_EQ(first.queries(), asked);
  writeTree(daemon, second);
  EXPECT_THAT(serverChecks(daemon), HasSubstr(text("Server", textOf(second))));
  EXPECT_EQ(second.queries(), 2);
}

TEST(ServerChecks, AreNotAmongAllManagedElements) {
  const UdpServer server("127.0.0.1", 0, UdpServer::answering());
  const TestDaemon daemon;
  writeTree(daemon, server);
  EXPECT_THAT(checks(daemon, "CIM_ManagedElement"), HasSubstr("ZORVA_DNSSettingOrigin"));
  EXPECT_EQ(server.queries(), 0);
}

TEST(ServerChecks, ThatAreTooManyAreLeftOut) {
  const TestDaemon daemon;
  std::string nodes;
  for (int i = 1; i <= 70; ++i) {
    const std::string number = std::to_string(i);
    nodes +=
        (i > 1 ? "," : "") + (R"({"type":"Port","name":"eth)" + number) +
        R"(","description":"","children":[{"type":"NetworkIPConfig","name":"ip","description":"","properties":{"name":"eth)" +
        number + R"(","dns_server_addresses":["127.0.1.)" + number + "\"]}}]}";
  }
  daemon.directory().write("tree.json", R"({"system_name":"host1","nodes":[{"type":"System","name":"system",)"
                                        R"("description":"Computer","children":[)" +
                                            nodes + "]}]}");
  const std::string answer = serverChecks(daemon);
  EXPECT_THAT(answer, AllOf(HasSubstr(text("Server", "127.0.1.64")), Not(HasSubstr("127.0.1.65"))));
}

}  // namespace
}  // namespace zorva::server
