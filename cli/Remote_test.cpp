// zorvactl --url as a process: with the server of this project, where it must print the same as without one, and with
// servers that misbehave.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <regex>

#include "cli/testing/Running.h"
#include "cli/testing/TestServer.h"

namespace zorva::cli {
namespace {

constexpr const char* kFile =
    "HOSTNAME=host1\nDOMAINNAME=example.org\nCONFIG_NAME=\nDNSSERVERS=192.0.2.53 \n"
    "DNSSUFFIXES=example.org \n";

/// Names of a host and a service processor, with addresses, odd names and files of settings.
void makeWorld(const TestHost& host) {
  const std::string addresses = R"("addresses": [{"address": "192.0.2.10", "prefix_length": 24, "origin": "static"},)"
                                R"({"address": "2001:db8::10", "prefix_length": 64, "origin": "slaac"}])";
  host.writeTree(
      R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
      R"("children": [)" +
      TestHost::port("eth0", R"("domain_name": "example.org", "dns_suffixes": ["a&b", "<\"x y\">"], )" + addresses) +
      "," + TestHost::port("\u7db2\u8def") +
      R"(]}, {"type": "System", "name": "sp", "description": "BMC", "children": [)" +
      TestHost::port("mgmt0", addresses) + "]}]}");
  host.directory().write("data/ifcfg-eth0", kFile);
}

/// Without the hosts of paths, which a server may write where the providers do not, and vice versa.
std::string withoutHosts(std::string text) {
  for (const auto& [pattern, replacement] :
       std::vector<std::pair<std::string, std::string>>{{R"(//[A-Za-z0-9.-]+/(?=root/))", ""},
                                                        {"</?NAMESPACEPATH>|<HOST>[^<]*</HOST>", ""},
                                                        {"LOCALINSTANCEPATH", "INSTANCEPATH"},
                                                        {"OBJECTWITHLOCALPATH", "OBJECTWITHPATH"}}) {
    text = std::regex_replace(text, std::regex(pattern), replacement);
  }
  return text;
}

/// One host, served.
class Remote : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    host_ = new TestHost;
    makeWorld(*host_);
    server_ = new TestServer(*host_);
  }
  static void TearDownTestSuite() {
    delete server_;
    delete host_;
  }

  void SetUp() override { ASSERT_NE(server_->url(), "") << "the server did not start"; }

  static Outcome local(Words words) {
    words.insert(words.end(), {"--log-level", "9999"});
    return host_->run(words);
  }
  static Outcome remote(Words words) {
    words.insert(words.end(), {"--url", server_->url() + "/root/cimv2"});
    return host_->run(words);
  }

  static void expectSame(const Words& words) {
    std::string command;
    for (const std::string& word : words) command += word + " ";
    const Outcome here = local(words);
    const Outcome there = remote(words);
    EXPECT_EQ(there.exitCode, here.exitCode) << command << there.err;
    EXPECT_EQ(withoutHosts(there.out), withoutHosts(here.out)) << command;
    EXPECT_EQ(withoutHosts(there.err), withoutHosts(here.err)) << command;
  }

  static TestHost* host_;
  static TestServer* server_;
};

TestHost* Remote::host_ = nullptr;
TestServer* Remote::server_ = nullptr;

// The server alone has ZORVA_DNSSettingOrigin, so its CIM_ManagedElement is more.
TEST_F(Remote, EnumeratesTheSameInEachFormat) {
  for (const char* format : {"table", "json", "mof", "xml"}) {
    for (const char* name :
         {"CIM_ManagedSystemElement", "CIM_SettingData", "CIM_Dependency", "CIM_Component", "CIM_ElementSettingData"}) {
      expectSame({"ei", name, "-o", format});
    }
  }
  expectSame({"ei", "zorva_dnsprotocolendpoint", "--property", "hostname", "--property", "EnabledState"});
  expectSame({"ein", "CIM_ManagedSystemElement"});
  expectSame({"ein", "CIM_SettingData", "-o", "json"});
}

TEST_F(Remote, GetsTheSame) {
  for (const char* format : {"table", "json", "mof", "xml"}) {
    expectSame({"gi", kEndpoint, "-o", format});
    expectSame({"gi", kSetting, "-o", format});
  }
  expectSame({"gi", "ZORVA_DNSGeneralSettingData", "--property", "InstanceID"});
  expectSame({"gi", R"(ZORVA_DNSHostedAccessPoint.Dependent="ZORVA_DNSProtocolEndPoint.Name=\"mgmt0\"")"});
}

TEST_F(Remote, FollowsTheSameAssociations) {
  for (const char* format : {"table", "json"}) {
    for (const char* name : {"CIM_Dependency", "CIM_ElementSettingData"}) {
      expectSame({"ai", kEndpoint, "--assoc-class", name, "-o", format});
      expectSame({"ain", kEndpoint, "--assoc-class", name, "-o", format});
      expectSame({"ri", kEndpoint, "--result-class", name, "-o", format});
    }
    expectSame({"rin", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")", "-o", format});
  }
  expectSame({"ai", kEndpoint, "--result-class", "CIM_RemoteServiceAccessPoint", "--property", "Name"});
  expectSame(
      {"ain", kEndpoint, "--assoc-class", "CIM_Dependency", "--role", "Dependent", "--result-role", "Antecedent"});
  expectSame({"ri", kSetting, "--result-class", "ZORVA_DNSOrderedComponent", "--role", "PartComponent"});
  expectSame({"ain", R"(ZORVA_SPComputerSystem)"});
}

TEST_F(Remote, FindsTheProfileOfAnEndpoint) {
  EXPECT_THAT(remote({"ain", kEndpoint}).out, HasSubstr("interop:CIM_RegisteredProfile.InstanceID="));
  EXPECT_THAT(local({"ain", kEndpoint}).out, Not(HasSubstr("CIM_RegisteredProfile")));
}

TEST_F(Remote, DrawsTheSameGraph) {
  for (const char* format : {"table", "json", "dot"}) expectSame({"graph", "-o", format});
  expectSame({"graph", kSetting});
}

TEST_F(Remote, ShowsTheSame) {
  EXPECT_EQ(contentOf(remote({"show", "-o", "json"}).out), contentOf(local({"show", "-o", "json"}).out));
  for (const Words& words : {Words{"show", "--all"}, Words{"show", "eth0"}, Words{"show", "mgmt0"}}) expectSame(words);
  EXPECT_THAT(remote({"show"}).out, AllOf(HasSubstr("ifcfg-eth0"), HasSubstr("The suffixes are kept in ifcfg-eth0")));

  json classes = contentOf(local({"classes", "-o", "json"}).out);
  for (json& row : classes) {
    row.erase("provider");
    row.erase("library");
  }
  EXPECT_EQ(contentOf(remote({"classes", "-o", "json"}).out), classes);
  EXPECT_THAT(remote({"classes"}).out, Not(HasSubstr("PROVIDER")));
}

TEST_F(Remote, CallsTheSameMethods) {
  expectSame({"cm", kEndpoint, "SetDNSDomain", "DNSDomain=x.example"});
  expectSame(
      {"cm", kEndpoint, "SetDNSSuffixSearchOrder", "DNSDomainSuffixSearchOrder=a", "DNSDomainSuffixSearchOrder=b"});
  expectSame({"cm", kEndpoint, "SetDNSDomain", "DNSDomain=x", "-o", "json"});
  expectSame({"cm", kEndpoint, "SetDNSDomain"});
}

TEST_F(Remote, FailsTheSame) {
  expectSame({"gi", R"(ZORVA_DNSSettingData.InstanceID="nothing")"});
  expectSame({"gi", "ZORVA_DNSSettingData"});
  expectSame({"gi", R"(ZORVA_DNSProtocolEndPoint.Name="eth9")"});
  expectSame({"gi", R"(ZORVA_DNSSettingData.Foo="x")"});
  expectSame({"gi", R"(ZORVA_DNSSettingData.InstanceID="x)"});
  expectSame({"ei", "ZORVA_DNSProtocol"});
  expectSame({"ai", kEndpoint, "--assoc-class", "CIM_Nothing"});
  EXPECT_EQ(remote({"ain", kEndpoint, "--role", "Nobody"}).exitCode, 2);
  expectSame({"modify", kSetting, "DomainName=a\nb"});
  expectSame({"modify", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")", "ElementName=x"});
  expectSame({"dns", "show", "eth7"});
}

TEST_F(Remote, ShowsAndTriesChangesTheSame) {
  expectSame({"dns", "show", "eth0"});
  EXPECT_EQ(remote({"suffixes", "show"}).out, local({"suffixes", "show"}).out);
  EXPECT_EQ(remote({"suffixes", "show"}).err, "") << "which file has them is not known of another host";
  expectSame({"dns", "add", "eth0", "192.0.2.99", "--dry-run"});
  expectSame({"domain", "eth0", "lab.example.org", "--dry-run"});
  expectSame({"modify", kSetting, "DomainName=lab.example.org", "--dry-run", "-o", "json"});
}

TEST(RemoteChange, WritesTheSameAsOneWithoutAServer) {
  const TestHost here;
  const TestHost there;
  makeWorld(here);
  makeWorld(there);
  const TestServer server(there);
  ASSERT_NE(server.url(), "");
  for (const Words& words :
       std::vector<Words>{{"modify", kSetting, "DomainName=lab.example.org", "RequestedHostname=h2"},
                          {"modify", kSetting, "ConfigurationName=a \"b\" <c>", "--only"},
                          {"modify", kSetting, "DomainName=bad name"},
                          {"dns", "set", "eth0", "192.0.2.1", "2001:db8::1"},
                          {"dns", "add", "eth0", "192.0.2.2"},
                          {"dns", "remove", "eth0", "192.0.2.1"},
                          {"domain", "eth0", "x.example"},
                          {"suffixes", "set", "a.example", "b.example"},
                          {"suffixes", "remove", "a.example"},
                          {"modify", kEndpoint, "DomainName=set.example"}}) {
    Words without = words;
    without.insert(without.end(), {"--log-level", "9999"});
    Words with = words;
    with.insert(with.end(), {"--url", server.url()});
    const Outcome a = here.run(without);
    const Outcome b = there.run(with);
    EXPECT_EQ(b.exitCode, a.exitCode) << words[0] << b.err;
    // Which file has the suffixes is not known of another host.
    const std::string changed = std::regex_replace(a.out, std::regex("The suffixes are kept in .*\n"), "");
    EXPECT_EQ(withoutHosts(b.out), withoutHosts(changed)) << words[0];
    EXPECT_EQ(withoutHosts(b.err), withoutHosts(a.err)) << words[0];
    EXPECT_EQ(contentsOf(there.dataFile("ifcfg-eth0")), contentsOf(here.dataFile("ifcfg-eth0"))) << words[0];
  }
  EXPECT_EQ(there.run({"tree", "-o", "json"}).out, here.run({"tree", "-o", "json"}).out);
  EXPECT_THAT(contentsOf(there.dataFile("ifcfg-eth0")), HasSubstr("DNSSERVERS=2001:db8::1 192.0.2.2 \n"));
}

TEST(RemoteChange, FailsIfNothingWasStored) {
  const TestHost host;
  const TestServer server(host);
  const Outcome outcome = host.run({"domain", "eth0", "lab.example.org", "--url", server.url()});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("CIM_ERR_FAILED (1): DomainName was not stored: " + host.dataFile("ifcfg-eth0") +
                                     " does not exist"));
}

TEST_F(Remote, ReachesTheOtherNamespacesOfAServer) {
  const Outcome outcome = host_->run({"ei", "CIM_Namespace", "-o", "json", "--url", server_->url() + "/interop"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, HasSubstr("root/cimv2"));
  EXPECT_EQ(remote({"ei", "interop:CIM_Namespace", "-o", "json"}).out, outcome.out);
}

TEST_F(Remote, RefusesWhatIsAboutFilesOfThisHost) {
  for (const Words& words : std::vector<Words>{
           {"tree"}, {"ifcfg", "init", "eth0"}, {"ifcfg", "show", "eth0"}, {"overlay", "show"}, {"overlay", "clear"}}) {
    const Outcome outcome = remote(words);
    EXPECT_EQ(outcome.exitCode, 2) << words[0];
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.err, HasSubstr("is about files of this host, which no CIM server hands out"));
  }
}

TEST_F(Remote, NeedsNoConfigurationOfTheAgentHere) {
  EXPECT_EQ(host_
                ->runWith({{"ZORVAGENT_CONFIG", "/nowhere/agent.toml"}},
                          {"ein", "ZORVA_DNSSettingData", "--url", server_->url()})
                .exitCode,
            0);
}

TEST(RemoteShow, SaysWhoOwnsAValueAndWhichWereSet) {
  const TestHost host;
  host.writeTree(
      R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
      R"("properties": {"dns_owner": "systemd-resolved", "dns_server_addresses": ["192.0.2.98"], "resolver_servers":)"
      R"(["127.0.0.53"], "resolver_servers_not_asked": ["192.0.2.99"], "resolver_search": ["example.org"]},)"
      R"("children": [)" +
      TestHost::port("eth0", R"("dns_owner": "NetworkManager", "dns_profile": "lan")") + "," +
      TestHost::port("eth1", R"("dns_owner": "systemd-networkd", "dns_origin": "static")") + "]}]}");
  const Outcome set = host.run({"modify", R"(ZORVA_DNSProtocolEndPoint.Name="eth1")", "DomainName=set.example"});
  ASSERT_EQ(set.exitCode, 0) << set.err;
  const TestServer server(host);
  for (const Words& words : {Words{"show"}, Words{"show", "eth0"}, Words{"show", "eth1"}}) {
    Words there = words;
    there.insert(there.end(), {"--url", server.url()});
    EXPECT_EQ(host.run(there).out, host.run(words).out);
  }
  EXPECT_THAT(host.run({"show", "--url", server.url()}).out,
              AllOf(HasSubstr("  NetworkManager, profile lan\n"), HasSubstr("  overlay.json\n"),
                    HasSubstr("  systemd-resolved asks  192.0.2.98\n")));
  EXPECT_THAT(host.run({"show", "eth1", "--url", server.url()}).out,
              HasSubstr("DomainName          set   set.example\n"));
}

/// What "show" writes with a server that has one endpoint and answers so to the question where settings come from.
Outcome shownBy(const std::string& answer) {
  const ScriptedServer server([&](const std::string& request) -> std::optional<std::string> {
    if (request.find("ZORVA_DNSSettingOrigin") != std::string::npos) return answer;
    const bool isEndpoint = request.find("ZORVA_DNSProtocolEndPoint") != std::string::npos;
    return ScriptedServer::cimReply(
        isEndpoint ? "<IRETURNVALUE><VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME=\"ZORVA_DNSProtocolEndPoint\"/>"
                     "<INSTANCE CLASSNAME=\"ZORVA_DNSProtocolEndPoint\"><PROPERTY NAME=\"Name\" TYPE=\"string\">"
                     "<VALUE>eth0</VALUE></PROPERTY></INSTANCE></VALUE.NAMEDINSTANCE></IRETURNVALUE>"
                   : "<IRETURNVALUE/>");
  });
  return TestHost().run({"show", "--all", "--url", server.url()});
}

TEST(RemoteShow, HasNoSourcesWhereTheServerHasNoClassForThem) {
  for (const char* code : {"5", "7"}) {
    const Outcome outcome = shownBy(ScriptedServer::failedReply("<IRETURNVALUE/>", code, "unknown"));
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_THAT(outcome.out, AllOf(HasSubstr("\neth0"), Not(HasSubstr("FROM"))));
  }
}

TEST(RemoteShow, WarnsWhereTheServerFailsToSayTheSources) {
  const Outcome outcome = shownBy(ScriptedServer::failedReply("<IRETURNVALUE/>", "1", "it%20fell"));
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, HasSubstr("ZORVA_DNSSettingOrigin: CIM_ERR_FAILED (1): it fell"));
  EXPECT_THAT(outcome.out, AllOf(HasSubstr("\neth0"), Not(HasSubstr("FROM"))));
}

// --- servers that misbehave

/// How "names" ends with a server that sends this.
Outcome against(const std::string& reply) {
  const ScriptedServer server({reply});
  return TestHost().run({"names", "ZORVA_DNSSettingData", "--url", server.url()});
}

TEST(RemoteFailure, ReportsThatNoServerListens) {
  const Outcome outcome = TestHost().run({"show", "--url", "http://127.0.0.1:1"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, StartsWith("zorvactl: no answer from http://127.0.0.1:1: "));
}

TEST(RemoteFailure, ReportsAWrongUrl) {
  const Outcome outcome = TestHost().run({"show", "--url", "localhost:5988"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_THAT(outcome.err, HasSubstr("--url: it begins neither with https:// nor with http:// nor with unix:"));
}

TEST(RemoteFailure, ReportsHttpErrors) {
  Outcome outcome = against(ScriptedServer::reply("", "401 Unauthorized"));
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr(" asks for a login\n"), HasSubstr("--url https://USER@HOST:5989")));
  outcome = against(ScriptedServer::reply("a login needs https\nmore", "401 Unauthorized",
                                          "Content-Type: text/plain; charset=utf-8\r\n"));
  EXPECT_THAT(outcome.err, HasSubstr(" asks for a login: a login needs https\n"));
  outcome = against(ScriptedServer::reply("no page\x1B may ask", "403 Forbidden", "Content-Type: text/plain\r\n"));
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr(" refuses this client: no page\\x1B may ask\n"));
  outcome = against(ScriptedServer::reply("", "400 Bad Request", "CIMError: request-not-well-formed%20\x1B[2J\r\n"));
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("answered HTTP 400: request-not-well-formed \\x1B[2J\n"));
  outcome = against(ScriptedServer::reply("", "302 Found", "Location: http://127.0.0.1:1/\r\n"));
  EXPECT_THAT(outcome.err, HasSubstr("answered HTTP 302\n")) << "a redirection is not followed";
}

TEST(RemoteFailure, ReportsATextThatIsNoCimXml) {
  for (const char* body : {"", "hello", "<html></html>", "<CIM><MESSAGE>"}) {
    const Outcome outcome = against(ScriptedServer::reply(body));
    EXPECT_EQ(outcome.exitCode, 1) << body;
    EXPECT_THAT(outcome.err, HasSubstr("the answer of the server is no CIM-XML response: ")) << body;
  }
}

TEST(RemoteFailure, ReportsAnIncompleteAnswer) {
  Outcome outcome = against("HTTP/1.1 200 OK\r\nContent-Length: 1000\r\n\r\n<CIM>");
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("no answer from http://127.0.0.1:"));
  outcome = against(
      "HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\nTrailer: CIMStatusCode\r\n\r\n5\r\n<CIM>\r\n0\r\n"
      "CIMStatusCode: 1\r\nCIMStatusCodeDescription: it%20fell\r\n\r\n");
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("CIM_ERR_FAILED (1): the answer of http://127.0.0.1:"),
                                 HasSubstr(" broke off: it fell\n")));
}

constexpr const char* kEndpointName =
    R"(<INSTANCENAME CLASSNAME="ZORVA_DNSProtocolEndPoint"><KEYBINDING NAME="Name"><KEYVALUE>eth0</KEYVALUE>)"
    "</KEYBINDING></INSTANCENAME>";

TEST(RemoteTrailers, TheCimErrorAfterACompleteAnswerIsShownAndSoIsWhatCameBefore) {
  const Outcome outcome = against(ScriptedServer::failedReply(
      std::string("<IRETURNVALUE>") + kEndpointName + "</IRETURNVALUE>", "6", "it%20is%20gone"));
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out, "ZORVA_DNSProtocolEndPoint.Name=\"eth0\"\n");
  EXPECT_THAT(outcome.err, HasSubstr("ZORVA_DNSSettingData: CIM_ERR_NOT_FOUND (6): it is gone\n"));
}

TEST(RemoteTrailers, ACodeThatIsNoneIsAFailureAllTheSame) {
  for (const char* code : {"x", "-1", "99999999999"}) {
    const Outcome outcome = against(ScriptedServer::failedReply("<IRETURNVALUE/>", code, "odd"));
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_THAT(outcome.err, HasSubstr("CIM_ERR_FAILED (1): odd")) << code;
  }
}

TEST(RemoteTrailers, AGraphContinuesAfterThem) {
  const auto has = [](const std::string& request, const char* text) { return request.find(text) != std::string::npos; };
  const ScriptedServer server([&](const std::string& request) -> std::optional<std::string> {
    const bool isEndpoint = has(request, "ZORVA_DNSProtocolEndPoint");
    if (has(request, "\r\nCIMMethod: EnumerateInstanceNames\r\n")) {
      return isEndpoint ? ScriptedServer::cimReply(std::string("<IRETURNVALUE>") + kEndpointName + "</IRETURNVALUE>")
                        : ScriptedServer::failedReply("<IRETURNVALUE/>", "7", "not%20here");
    }
    if (has(request, "\r\nCIMMethod: GetInstance\r\n")) {
      return ScriptedServer::cimReply(
          R"(<IRETURNVALUE><INSTANCE CLASSNAME="ZORVA_DNSProtocolEndPoint"></INSTANCE></IRETURNVALUE>)");
    }
    return ScriptedServer::failedReply("<IRETURNVALUE/>", "1", "the%20provider%20fell");
  });
  const Outcome outcome = TestHost().run({"graph", "--url", server.url()});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, AllOf(StartsWith("ZORVA_DNSProtocolEndPoint.Name=\"eth0\"\n"), HasSubstr("1 object")));
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("ZORVA_DNSSettingData"), HasSubstr("CIM_ERR_NOT_SUPPORTED (7): not here\n"),
                                 HasSubstr("associations of ZORVA_DNSProtocolEndPoint eth0: CIM_ERR_FAILED (1): the "
                                           "provider fell\n")));
}

TEST(RemoteChange, FailsWhereAServerSaysItWasDoneAndItWasNot) {
  const auto instance = [](const std::string& domain) {
    return ScriptedServer::cimReply(
        "<IRETURNVALUE><INSTANCE CLASSNAME=\"ZORVA_DNSSettingData\"><PROPERTY "
        "NAME=\"DomainName\" TYPE=\"string\"><VALUE>" +
        domain + "</VALUE></PROPERTY></INSTANCE></IRETURNVALUE>");
  };
  const ScriptedServer server({instance("old"), ScriptedServer::cimReply(""), instance("old")});
  const Outcome outcome = TestHost().run({"modify", kSetting, "DomainName=new", "--url", server.url()});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("DomainName was not stored: the interface's file of settings there is missing, or "
                                     "has no line DOMAINNAME="));
}

TEST(RemoteFailure, ShowsNoControlCharacterOfAServer) {
  const Outcome outcome = against(ScriptedServer::cimReply(
      R"(<IRETURNVALUE><INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="K"><KEYVALUE>a&#x85;&#9;b</KEYVALUE></KEYBINDING>)"
      "</INSTANCENAME></IRETURNVALUE>"));
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "C.K=\"a\\u0085\\tb\"\n");
}

// --- classes that are not known here

constexpr const char* kDisk =
    R"(<IRETURNVALUE><CLASS NAME="X_Disk"><PROPERTY NAME="Number" TYPE="uint16"><QUALIFIER NAME="Key" TYPE="boolean">)"
    R"(<VALUE>TRUE</VALUE></QUALIFIER></PROPERTY><PROPERTY NAME="State" TYPE="uint8"></PROPERTY>)"
    R"(<METHOD NAME="Spin" TYPE="uint32"><PARAMETER NAME="Speed" TYPE="sint32"/></METHOD></CLASS></IRETURNVALUE>)";
constexpr const char* kDiskNames =
    R"(<IRETURNVALUE><INSTANCENAME CLASSNAME="X_Disk"><KEYBINDING NAME="Number"><KEYVALUE VALUETYPE="numeric">7)"
    R"(</KEYVALUE></KEYBINDING></INSTANCENAME></IRETURNVALUE>)";

TEST(RemoteClass, IsRequestedIfItIsNotKnownHere) {
  const ScriptedServer server(
      {ScriptedServer::cimReply(kDisk), ScriptedServer::cimReply(kDiskNames),
       ScriptedServer::cimReply(R"(<IRETURNVALUE><INSTANCE CLASSNAME="X_Disk"><PROPERTY NAME="State" TYPE="uint8">)"
                                "<VALUE>3</VALUE></PROPERTY></INSTANCE></IRETURNVALUE>")});
  const Outcome outcome = TestHost().run({"gi", "x_disk", "--url", server.url()});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "X_Disk.Number=7\n  State  3\n");
  ASSERT_EQ(server.requests().size(), 3U);
  EXPECT_THAT(server.requests()[0],
              AllOf(HasSubstr("CIMMethod: GetClass\r\n"), HasSubstr("CIMObject: root/cimv2\r\n")));
  EXPECT_THAT(server.requests()[2], HasSubstr(R"(<KEYVALUE VALUETYPE="numeric")"));
}

TEST(RemoteClass, GivesTheTypesOfMethodParameters) {
  const ScriptedServer server(
      {ScriptedServer::cimReply(kDisk), ScriptedServer::cimReply(kDiskNames),
       ScriptedServer::reply(
           R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLERSP>)"
           R"(<METHODRESPONSE NAME="Spin"><RETURNVALUE PARAMTYPE="uint32"><VALUE>0</VALUE></RETURNVALUE>)"
           "</METHODRESPONSE></SIMPLERSP></MESSAGE></CIM>")});
  const Outcome outcome = TestHost().run({"cm", "X_Disk", "spin", "Speed=-5", "--url", server.url()});
  EXPECT_EQ(outcome.out, "ReturnValue  0\n") << outcome.err;
  ASSERT_EQ(server.requests().size(), 3U);
  EXPECT_THAT(server.requests()[2],
              AllOf(HasSubstr("CIMObject: root/cimv2:X_Disk.Number%3D7\r\n"),
                    HasSubstr(R"(<PARAMVALUE NAME="Speed" PARAMTYPE="sint32"><VALUE>-5</VALUE></PARAMVALUE>)")));
}

TEST(RemoteClass, ThatTheServerLacksTooIsRefused) {
  const ScriptedServer server({ScriptedServer::cimReply(R"(<ERROR CODE="6" DESCRIPTION="no"/>)")});
  const Outcome outcome = TestHost().run({"ei", "X_Nothing", "--url", server.url()});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_THAT(outcome.err, HasSubstr("there is no class X_Nothing"));
}

}  // namespace
}  // namespace zorva::cli
