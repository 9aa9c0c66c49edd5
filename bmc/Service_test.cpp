// The service against a Redfish service of the tests' own, which answers as real ones do, and as none should.

#include "bmc/Service.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "bmc/Ethernet.h"
#include "bmc/testing/TestRedfish.h"

namespace zorva::bmc {
namespace {

using namespace ZV::NodeLexicon;
using agent::Node;
using agent::testing::contentsOf;
using std::chrono::milliseconds;
using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using testing::json;
using testing::kEth0;
using ::testing::Not;
using testing::TestRedfish;

constexpr Patience kShort{milliseconds(3000), milliseconds(6000), milliseconds(300)};

class ServiceTest : public ::testing::Test {
 protected:
  std::unique_ptr<Service> service(Patience patience = {}) { return service(redfish_.config(), patience); }

  static std::unique_ptr<Service> service(const agent::BmcConfig& config, Patience patience = {}) {
    return std::make_unique<Service>(
        config,
        Target{config.url, {config.caFile, config.fingerprint}, loginFromFile(config.user, config.passwordFile)},
        patience);
  }

  agent::BmcState state() const { return agent::readBmcState(redfish_.bmcJson()); }

  // What the service answers to the agent.
  static json ask(Service& service, json request) {
    request["resource"] = kEth0;
    return json::parse(service.answer(request.dump()));
  }

  void TearDown() override {
    const json answers = redfish_.tell({{"invalid", true}});
    EXPECT_EQ(answers["invalid"], json::array()) << "DMTF's schemas refuse these answers of the tests' service";
  }

  TestRedfish redfish_;
};

const Node* nodeOf(const agent::BmcState& state, const char* path) { return state.tree->find(path); }

TEST_F(ServiceTest, ReadsEveryInterfaceOfEveryManager) {
  ASSERT_TRUE(service()->readOnce());
  const agent::BmcState now = state();
  const Node* eth0 = nodeOf(now, "/bmc.1/eth0/ip");
  ASSERT_NE(eth0, nullptr);
  EXPECT_EQ(*eth0->text(PROP_NAME), "eth0");
  EXPECT_EQ(*eth0->text(PROP_HOST_NAME), "host1-bmc");
  EXPECT_EQ(*eth0->text(PROP_DOMAIN_NAME), "mgmt.example.org");
  EXPECT_EQ(*eth0->list(PROP_DNS_SERVER_ADDRESSES), (StringList{"192.0.2.53", "2001:db8::53"}));
  EXPECT_EQ(*eth0->number(PROP_ENABLED_STATE), 1U);
  EXPECT_EQ(*eth0->number(PROP_PROTOCOL_IF_TYPE), 4098U);
  EXPECT_EQ(eth0->addresses().front(), (agent::InterfaceAddress{"192.0.2.20", 24, agent::AddressOrigin::Static}));
  EXPECT_EQ(*eth0->text(agent::kDnsOrigin), "static");
  EXPECT_EQ(*nodeOf(now, "/bmc.1/usb0/ip")->number(PROP_ENABLED_STATE), 12U) << "its link is down";
  EXPECT_EQ(now.problem, "");
  EXPECT_NEAR(static_cast<double>(now.readAt), static_cast<double>(std::time(nullptr)), 60);
}

TEST_F(ServiceTest, TheAnswersOfTheTestsServiceAreCheckedBySchemasWhereThereAreAny) {
  if (std::string(ZORVA_REDFISH_SCHEMA_DIR).empty()) GTEST_SKIP() << "ZORVA_REDFISH_SCHEMA_DIR names no schemas";
  ASSERT_TRUE(service()->readOnce());
  EXPECT_GT(redfish_.tell({{"invalid", true}})["checked"], 0) << "Python's package jsonschema is needed";
}

TEST_F(ServiceTest, TheFileIsForOwnerAndGroupAndHoldsNoPassword) {
  ASSERT_TRUE(service()->readOnce());
  struct stat status {};
  ASSERT_EQ(::stat(redfish_.bmcJson().c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0640U);
  EXPECT_THAT(contentsOf(redfish_.bmcJson()), AllOf(Not(HasSubstr(testing::kPassword)), Not(HasSubstr("token"))));
}

TEST_F(ServiceTest, WithoutExpandItReadsOneByOneAndAsksOnlyWhetherSomethingChanged) {
  redfish_.tell({{"expand", false}});
  const auto reader = service();
  ASSERT_TRUE(reader->readOnce());
  const std::string first = contentsOf(redfish_.bmcJson());
  redfish_.requests();
  ASSERT_TRUE(reader->readOnce());
  int conditional = 0;
  for (const json& each : redfish_.tell({{"log", true}})) conditional += each.contains("If-None-Match") ? 1 : 0;
  EXPECT_EQ(conditional, 5) << "two collections, a manager, two interfaces";
  const auto withoutTime = [](const std::string& text) { return text.substr(text.find("interval")); };
  EXPECT_EQ(withoutTime(contentsOf(redfish_.bmcJson())), withoutTime(first));
  redfish_.tell({{"set", {{kEth0, {{"FQDN", "host1-bmc.example.net"}}}}}});
  ASSERT_TRUE(reader->readOnce());
  EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->text(PROP_DOMAIN_NAME), "example.net");
}

TEST_F(ServiceTest, OneSessionIsUsedUntilItExpiresAndIsEnded) {
  const auto reader = service();
  ASSERT_TRUE(reader->readOnce());
  ASSERT_TRUE(reader->readOnce());
  const auto isLogin = [](const std::string& line) { return line.starts_with("POST "); };
  std::vector<std::string> lines = redfish_.requests();
  EXPECT_EQ(std::count_if(lines.begin(), lines.end(), isLogin), 1);
  redfish_.tell({{"requests_of_session", 3}});
  ASSERT_TRUE(reader->readOnce());
  ASSERT_TRUE(reader->readOnce());
  redfish_.tell({{"requests_of_session", 0}});
  ASSERT_TRUE(reader->readOnce());
  lines = redfish_.requests();
  EXPECT_GE(std::count_if(lines.begin(), lines.end(), isLogin), 1);
  reader->logOut();
  EXPECT_THAT(redfish_.requests(), Contains(HasSubstr("DELETE /redfish/v1/SessionService/Sessions/")));
}

TEST_F(ServiceTest, WhateverGoesWrongTheLastStateStaysWithItsAge) {
  const auto reader = service(kShort);
  ASSERT_TRUE(reader->readOnce());
  const agent::BmcState before = state();
  const std::vector<std::pair<std::string, std::string>> cases{
      {"html", "cannot be read"},      {"deep", "nested more than 32 deep"},
      {"values", "more than 100000"},  {"huge", "too large"},
      {"list", "no JSON object"},      {"head", "too large"},
      {"trickle", "no answer"},        {"silent", "no answer"},
      {"far", "sends elsewhere"},      {"loop", "redirects without end"},
      {"redirect", "answers 404"},     {"outside", "a resource that is none"},
      {"busy", "The service is busy."}};
  for (const auto& [wrong, problem] : cases) {
    redfish_.tell({{"wrong", wrong}});
    EXPECT_FALSE(reader->readOnce()) << wrong;
    const agent::BmcState now = state();
    EXPECT_THAT(now.problem, HasSubstr(problem)) << wrong;
    EXPECT_EQ(now.readAt, before.readAt) << wrong;
    EXPECT_EQ(now.tree->nodes().size(), before.tree->nodes().size()) << wrong;
  }
  redfish_.tell({{"wrong", ""}});
  EXPECT_TRUE(reader->readOnce());
  EXPECT_EQ(state().problem, "");
}

TEST_F(ServiceTest, CyclesEndAndThousandsOfMembersAreCut) {
  const auto reader = service();
  redfish_.tell({{"wrong", "cycle"}});
  EXPECT_TRUE(reader->readOnce());
  EXPECT_EQ(state().tree->nodes().size(), 6U) << "root, manager, two ports with a node each";
  redfish_.tell({{"wrong", "many"}});
  EXPECT_TRUE(reader->readOnce());
  EXPECT_EQ(state().tree->nodes().size(), 2 + 2 * 64U) << "of 3,000 members on each of pages without end";
  redfish_.tell({{"wrong", ""}});
}

TEST_F(ServiceTest, AServiceThatIsGoneLeavesTheLastStateAlsoAfterARestart) {
  ASSERT_TRUE(service()->readOnce());
  const std::uint64_t readAt = state().readAt;
  const agent::BmcConfig config = redfish_.config();
  agent::BmcConfig gone = config;
  gone.url = "https://127.0.0.1:1";
  const auto reader = service(gone);
  EXPECT_FALSE(reader->readOnce());
  EXPECT_EQ(state().readAt, readAt);
  EXPECT_NE(nodeOf(state(), "/bmc.1/eth0/ip"), nullptr);
  EXPECT_THAT(state().problem, HasSubstr("no answer from https://127.0.0.1:1"));
}

TEST_F(ServiceTest, AServiceThatShowsNoInterfacesLeavesTheLastState) {
  const auto reader = service();
  ASSERT_TRUE(reader->readOnce());
  const json nobody{{"Members", json::array()}, {"Members@odata.count", 0}};
  for (const char* collection : {"/redfish/v1/Managers/1/EthernetInterfaces", "/redfish/v1/Managers"}) {
    const agent::BmcState before = state();
    const json full = redfish_.tell({{"get", collection}});
    redfish_.tell({{"set", {{collection, nobody}}}});
    const auto afterRestart = service();
    for (Service* each : {reader.get(), afterRestart.get()}) {
      EXPECT_FALSE(each->readOnce()) << collection;
      EXPECT_EQ(state().readAt, before.readAt) << collection;
      EXPECT_NE(nodeOf(state(), "/bmc.1/eth0/ip"), nullptr) << collection;
      EXPECT_THAT(state().problem, HasSubstr("shows no Ethernet interfaces")) << collection;
    }
    redfish_.tell({{"set", {{collection, full}}}});
    EXPECT_TRUE(reader->readOnce());
    EXPECT_EQ(state().problem, "");
  }
}

TEST_F(ServiceTest, AServiceThatNeverHadInterfacesIsReadAsItIs) {
  redfish_.tell({{"set", {{"/redfish/v1/Managers", {{"Members", json::array()}, {"Members@odata.count", 0}}}}}});
  ASSERT_TRUE(service()->readOnce());
  EXPECT_EQ(state().tree->nodes().size(), 1U);
  EXPECT_EQ(state().problem, "");
}

TEST_F(ServiceTest, ALoginThatIsRefusedIsNotTriedAgainAtOnce) {
  redfish_.tell({{"login", 401}});
  const auto reader = service();
  EXPECT_FALSE(reader->readOnce());
  EXPECT_THAT(state().problem, AllOf(HasSubstr("refused the login of operator"), Not(HasSubstr(testing::kPassword))));
  redfish_.requests();
  EXPECT_FALSE(reader->readOnce());
  EXPECT_THAT(redfish_.requests(), Not(Contains(HasSubstr("POST")))) << "it could lock the account";
}

TEST_F(ServiceTest, APasswordFileThatOthersMayReadIsRefused) {
  ::chmod(redfish_.config().passwordFile.c_str(), 0640);
  EXPECT_FALSE(service()->readOnce());
  EXPECT_THAT(state().problem, HasSubstr("'chmod 600'"));
  EXPECT_THAT(redfish_.requests(), Not(Contains(HasSubstr("POST"))));
}

TEST_F(ServiceTest, NothingIsSentToAServiceWithAnotherCertificate) {
  agent::BmcConfig config = redfish_.config();
  const std::string right = http::testing::fingerprintByOpenssl(redfish_.certificate());
  config.caFile.clear();
  config.fingerprint = right;
  const auto pinned = service(config);
  redfish_.tell({{"close", true}});  // so that each request has a connection of its own
  EXPECT_TRUE(pinned->readOnce());
  redfish_.requests();
  config.fingerprint = std::string(64, '0');
  EXPECT_FALSE(service(config)->readOnce());
  EXPECT_THAT(state().problem, AllOf(HasSubstr("nothing was sent"), HasSubstr(right)));
  config.fingerprint.clear();
  EXPECT_FALSE(service(config)->readOnce()) << "the system's authorities do not know it";
  EXPECT_THAT(state().problem, HasSubstr("is not trusted, and nothing was sent"));
  EXPECT_EQ(redfish_.requests(), std::vector<std::string>());
  redfish_.changeCertificate();
  config.fingerprint = right;
  const auto another = service(config);
  for (Service* reader : {pinned.get(), another.get()}) {
    EXPECT_FALSE(reader->readOnce());
    EXPECT_THAT(state().problem, HasSubstr("nothing was sent"));
    EXPECT_EQ(redfish_.requests(), std::vector<std::string>());
  }
  EXPECT_TRUE(service()->readOnce()) << "the authority signed the new one too";
}

TEST_F(ServiceTest, AChangeSendsOnlyWhatChangesWithItsEtagAndThePaddingOfTheService) {
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  redfish_.patches();
  EXPECT_EQ(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}, {"domain", "mgmt.example.org"}}),
            json({{"note", ""}}));
  EXPECT_EQ(redfish_.patches(), json::parse(R"([{"method": "PATCH", "path": ")" + std::string(kEth0) +
                                            R"(", "If-Match": "\"v1\"",
                                        "body": {"StaticNameServers": ["192.0.2.1", "", "", ""]}}])"));
  EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->list(PROP_DNS_SERVER_ADDRESSES), StringList{"192.0.2.1"});
  ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}, {"domain", "example.net"}});
  EXPECT_EQ(redfish_.patches()[0]["body"], json::parse(R"({"FQDN": "host1-bmc.example.net"})"));
  ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}, {"domain", "example.net"}});
  EXPECT_EQ(redfish_.patches(), json::array()) << "it has these settings already";
}

TEST_F(ServiceTest, NullsArePaddingToo) {
  redfish_.tell({{"set", {{kEth0, {{"StaticNameServers", {"192.0.2.53", nullptr}}}}}}});
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  ask(*writer, {{"action", "write"}, {"servers", {"2001:db8::1"}}});
  EXPECT_EQ(redfish_.patches()[0]["body"], json::parse(R"({"StaticNameServers": ["2001:db8::1", null]})"));
}

TEST_F(ServiceTest, EachAnswerToAChangeIsUnderstood) {
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  int number = 1;
  for (const int status : {200, 202, 204, 412, 503}) {
    redfish_.tell({{"patch", status}, {"etag", number % 2 == 0 ? "weak" : "strong"}});
    const std::string server = "192.0.2." + std::to_string(number++);
    const json answer = ask(*writer, {{"action", "write"}, {"servers", {server}}});
    EXPECT_FALSE(answer.contains("problem")) << status << answer;
    EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->list(PROP_DNS_SERVER_ADDRESSES), StringList{server}) << status;
  }
  redfish_.tell({{"patch", 204}, {"etag", "absent"}});
  redfish_.patches();
  EXPECT_FALSE(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.99"}}}).contains("problem"));
  EXPECT_FALSE(redfish_.patches()[0].contains("If-Match"));
  redfish_.tell({{"etag", "body"}});
  EXPECT_FALSE(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.98"}}}).contains("problem"));
  EXPECT_THAT(redfish_.patches()[0]["If-Match"].get<std::string>(), ::testing::StartsWith("\"v")) << "from @odata.etag";
}

TEST_F(ServiceTest, AChangeIsTriedOnceMoreAndNotForEver) {
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  redfish_.patches();
  redfish_.tell({{"repeats", true}});
  for (const auto& [status, problem] :
       {std::pair{412, "somebody else keeps changing"}, {503, "The service is busy."}}) {
    redfish_.tell({{"patch", status}});
    EXPECT_THAT(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}})["problem"].get<std::string>(),
                HasSubstr(problem));
    EXPECT_EQ(redfish_.patches().size(), 2U) << status;
  }
}

TEST_F(ServiceTest, AServiceThatRefusesItsOwnEtagIsNamedAsTheCause) {
  redfish_.tell({{"etag", "weak"}, {"compares_strongly", true}});
  const auto writer = service();
  ASSERT_TRUE(writer->readOnce());
  redfish_.patches();
  EXPECT_THAT(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}})["problem"].get<std::string>(),
              HasSubstr("refuses the weak ETag that it gave itself for " + std::string(kEth0)));
  const json patches = redfish_.patches();
  ASSERT_EQ(patches.size(), 2U) << "it may have been changed by somebody the first time";
  EXPECT_EQ(patches[1]["If-Match"], "W/\"v1\"") << "never without an ETag: that could undo the change of another";
}

TEST_F(ServiceTest, AChangeMayBeInUseLaterAndTheServiceAwayMeanwhile) {
  Patience patience = kShort;
  patience.effect = milliseconds(5000);
  const auto writer = service(patience);
  ASSERT_TRUE(writer->readOnce());
  const auto domain = [this] { return *nodeOf(state(), "/bmc.1/eth0/ip")->text(PROP_DOMAIN_NAME); };
  redfish_.tell({{"late", 1}});
  EXPECT_EQ(ask(*writer, {{"action", "write"}, {"domain", "example.net"}}), json({{"note", ""}}));
  EXPECT_EQ(domain(), "example.net");
  redfish_.tell({{"late", 0}, {"restart", 1}});
  EXPECT_EQ(ask(*writer, {{"action", "restore"}, {"properties", {{"FQDN", "host1-bmc.example.org"}}}}),
            json({{"note", ""}}));
  EXPECT_EQ(domain(), "example.org");
}

TEST_F(ServiceTest, WhatTheServiceSaysOfARefusalIsShownInItsWords) {
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  redfish_.tell({{"patch", 400}});
  EXPECT_THAT(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}})["problem"].get<std::string>(),
              AllOf(HasSubstr("answers 400 to PATCH"),
                    HasSubstr("The value 192.0.2.1 of StaticNameServers is refused.\\n (Send another value.)")));
  redfish_.tell({{"patch", 202}, {"task", "Exception"}});
  EXPECT_THAT(ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}})["problem"].get<std::string>(),
              HasSubstr("gave up the change (Exception): The settings could not be stored."));
  redfish_.tell({{"patch", 202}, {"task", "Running"}});
  Patience less = kShort;
  less.change = milliseconds(1500);
  const auto hasty = service(less);
  ASSERT_TRUE(hasty->readOnce());
  EXPECT_THAT(ask(*hasty, {{"action", "write"}, {"servers", {"192.0.2.1"}}})["problem"].get<std::string>(),
              HasSubstr("in time"))
      << "a task without end";
}

TEST_F(ServiceTest, ServersOfDhcpThatWillBeDroppedAreNamedBefore) {
  redfish_.tell({{"set",
                  {{kEth0,
                    {{"StaticNameServers", {"", ""}},
                     {"NameServers", {"198.51.100.1"}},
                     {"DHCPv4", {{"DHCPEnabled", true}, {"UseDNSServers", true}, {"UseDomainName", true}}}}}}}});
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->text(agent::kDnsOrigin), "learned");
  const json plan = ask(*writer, {{"action", "read"}, {"servers", {"192.0.2.1"}}, {"domain", "example.net"}});
  EXPECT_EQ(plan["warning"],
            "the service processor will no longer use what DHCP gave it: 198.51.100.1; it will no longer take its "
            "domain from DHCP");
  EXPECT_EQ(redfish_.patches(), json::array()) << "nothing is changed by asking";
  ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}, {"domain", "mgmt.example.org"}});
  EXPECT_EQ(redfish_.patches()[0]["body"],
            json::parse(R"({"StaticNameServers": ["192.0.2.1", ""], "DHCPv4": {"UseDNSServers": false}})"));
  ask(*writer, {{"action", "restore"}, {"properties", plan["properties"]}});
  EXPECT_EQ(redfish_.tell({{"get", kEth0}})["NameServers"], json::parse(R"(["198.51.100.1"])"));
  EXPECT_EQ(redfish_.tell({{"get", kEth0}})["DHCPv4"]["UseDNSServers"], true);
}

TEST_F(ServiceTest, AnInterfaceWithoutFqdnHasNoDomainAndCannotBeGivenOne) {
  redfish_.tell({{"set", {{kEth0, {{"FQDN", nullptr}}}}}});
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  EXPECT_EQ(nodeOf(state(), "/bmc.1/eth0/ip")->text(PROP_DOMAIN_NAME), nullptr);
  EXPECT_THAT(ask(*writer, {{"action", "read"}, {"domain", "example.net"}})["problem"].get<std::string>(),
              HasSubstr("lacks FQDN or HostName"));
}

TEST_F(ServiceTest, AnInterfaceWithoutStaticNameServersIsShownAndCannotBeGivenServers) {
  redfish_.tell({{"set", {{kEth0, {{"StaticNameServers", nullptr}}}}}});
  const auto writer = service();
  ASSERT_TRUE(writer->readOnce());
  EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->list(PROP_DNS_SERVER_ADDRESSES),
            (StringList{"192.0.2.53", "2001:db8::53"}));
  redfish_.patches();
  for (const char* action : {"read", "write"}) {
    EXPECT_EQ(ask(*writer, {{"action", action}, {"servers", {"192.0.2.1"}}})["problem"],
              "interface eth0 has no StaticNameServers: its DNS servers cannot be set by Redfish");
  }
  EXPECT_EQ(redfish_.patches(), json::array());
}

TEST_F(ServiceTest, SeveralManagersWithInterfacesOfOneNameHavePathsOfTheirOwn) {
  const std::string second = "/redfish/v1/Managers/2";
  const json eth0 = redfish_.tell({{"get", kEth0}});
  json manager = redfish_.tell({{"get", "/redfish/v1/Managers/1"}});
  manager["EthernetInterfaces"]["@odata.id"] = second + "/EthernetInterfaces";
  json interfaces = redfish_.tell({{"get", "/redfish/v1/Managers/1/EthernetInterfaces"}});
  interfaces["Members"] = json::parse(R"([{"@odata.id": "/redfish/v1/Managers/2/EthernetInterfaces/a"},
                                          {"@odata.id": "/redfish/v1/Managers/2/EthernetInterfaces/b"}])");
  json set{{second, manager}, {second + "/EthernetInterfaces", interfaces}};
  for (const char* name : {"/EthernetInterfaces/a", "/EthernetInterfaces/b"}) set[second + name] = eth0;
  for (auto& [path, body] : set.items()) body["@odata.id"] = path;
  json both = json::parse(R"([{"@odata.id": "/redfish/v1/Managers/1"}, {"@odata.id": "/redfish/v1/Managers/2"}])");
  set["/redfish/v1/Managers"] = {{"Members", both}, {"Members@odata.count", 2}};
  redfish_.tell({{"set", set}});
  ASSERT_TRUE(service()->readOnce());
  const agent::BmcState now = state();
  for (const char* path : {"/bmc.1/eth0/ip", "/bmc.1~2/eth0/ip", "/bmc.1~2/eth0~2/ip"}) {
    ASSERT_NE(nodeOf(now, path), nullptr) << path;
    EXPECT_EQ(*nodeOf(now, path)->text(PROP_NAME), "eth0") << "names are as they are";
  }
}

TEST_F(ServiceTest, AChangeGoesToTheSettingsObjectWhereTheInterfaceNamesOne) {
  const std::string settings = std::string(kEth0) + "/SD";
  json body = redfish_.tell({{"get", kEth0}});
  body["@odata.id"] = settings;
  body["Id"] = "SD";
  redfish_.tell({{"set", {{settings, body}}}});
  json link = json::parse(R"({"@odata.type": "#Settings.v1_4_0.Settings", "Time": "2026-01-02T03:04:05Z",
      "ETag": "v0", "Messages": [{"MessageId": "Base.1.8.SettingsFailed",
                                  "RelatedProperties": ["/IPv6Addresses/PrefixLength"]}]})");
  link["SettingsObject"] = {{"@odata.id", settings}};
  redfish_.tell({{"set", {{kEth0, {{"@Redfish.Settings", link}}}}}});
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  ask(*writer, {{"action", "write"}, {"servers", {"192.0.2.1"}}});
  EXPECT_EQ(redfish_.patches()[0]["path"], settings);
  EXPECT_EQ(*nodeOf(state(), "/bmc.1/eth0/ip")->list(PROP_DNS_SERVER_ADDRESSES), StringList{"192.0.2.1"});
}

TEST_F(ServiceTest, WhatIsNoAddressOrNoNameIsLeftOut) {
  redfish_.tell({{"set",
                  {{kEth0,
                    {{"NameServers", {"0.0.0.0", "names.example.org", "::", "", "192.0.2.1", "192.0.2.1", "fe80::53"}},
                     {"HostName", "a\nb"},
                     {"FQDN", "host1..example.org"},
                     {"InterfaceEnabled", false}}}}}});
  ASSERT_TRUE(service()->readOnce());
  const agent::BmcState now = state();
  const Node& eth0 = *nodeOf(now, "/bmc.1/eth0/ip");
  EXPECT_EQ(*eth0.list(PROP_DNS_SERVER_ADDRESSES), (StringList{"192.0.2.1", "fe80::53%eth0"}));
  EXPECT_EQ(eth0.text(PROP_HOST_NAME), nullptr);
  EXPECT_EQ(eth0.text(PROP_DOMAIN_NAME), nullptr);
  EXPECT_EQ(*eth0.number(PROP_ENABLED_STATE), 16U);
}

TEST_F(ServiceTest, OnlyInterfacesThatWereReadCanBeChanged) {
  const auto writer = service(kShort);
  ASSERT_TRUE(writer->readOnce());
  redfish_.patches();
  for (const char* request : {"", "7", "{", R"({"action": "write", "resource": "/redfish/v1/AccountService"})",
                              R"({"action": "write", "resource": 7})"}) {
    EXPECT_TRUE(json::parse(writer->answer(request)).contains("problem")) << request;
  }
  EXPECT_TRUE(ask(*writer, {{"action", "erase"}}).contains("problem"));
  EXPECT_TRUE(ask(*writer, {{"action", "write"}, {"domain", "a b"}}).contains("problem"));
  EXPECT_EQ(redfish_.patches(), json::array());
}

}  // namespace
}  // namespace zorva::bmc
