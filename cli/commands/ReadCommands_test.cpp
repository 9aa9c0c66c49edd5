#include "cimxml/testing/Grammar.h"
#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Names, AreOneALine) {
  EXPECT_EQ(shown(TestHost(), {"ein", "ZORVA_DNSSettingData"}),
            "ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"\nZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"\n");
}

TEST(Names, IncludeThoseOfSubclasses) {
  EXPECT_EQ(jsonShown(TestHost(), {"ein", "cim_dnsprotocolendpoint"}).size(), 2U);
}

TEST(Names, CannotBeMofOrXml) {
  for (const char* format : {"mof", "xml", "dot"}) {
    const Outcome outcome = TestHost().run({"names", "ZORVA_DNSSettingData", "--output", format});
    EXPECT_EQ(outcome.exitCode, 2) << format;
    EXPECT_EQ(outcome.out, "");
  }
}

TEST(Enumerate, GivesTypedJson) {
  const json found = jsonShown(TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint"});
  ASSERT_EQ(found.size(), 2U);
  EXPECT_EQ(found[0]["class"], "ZORVA_DNSProtocolEndPoint");
  EXPECT_EQ(found[0]["properties"]["EnabledState"], 2);
  EXPECT_EQ(found[0]["properties"]["DNSSuffixesToAppend"], (json{"example.org", "example.net"}));
}

TEST(Enumerate, HasTheWordsOfNumbersBesideThem) {
  const json found = jsonShown(TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint"})[0];
  EXPECT_EQ(found["words"]["EnabledState"], "Enabled");
  EXPECT_FALSE(found["words"].contains("Hostname")) << "no word is no member";
}

TEST(Enumerate, GivesAnEmptyListIfThereIsNothing) {
  EXPECT_EQ(shown(TestHost(), {"ei", "ZORVA_SPComputerSystem", "-o", "json"}),
            "{\n  \"version\": 1,\n  \"results\": []\n}\n");
  EXPECT_EQ(shown(TestHost(), {"ei", "ZORVA_SPComputerSystem"}), "");
}

TEST(Enumerate, GivesOnlyThePropertiesThatAreWanted) {
  const json found = jsonShown(
      TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint", "--property", "Hostname", "--property", "EnabledState"});
  EXPECT_EQ(found[0]["properties"], json::parse(R"({"Hostname": "host1", "EnabledState": 2})"));
}

TEST(Enumerate, KeepsNumbersBesideTheirWordsInATable) {
  EXPECT_THAT(shown(TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint"}),
              testing::ContainsRegex("  EnabledState +2 \\(Enabled\\)\n"));
}

TEST(Enumerate, ShowsThePropertiesThatHaveNoValue) {
  const TestHost host({TestHost::port("eth0")});
  const Words words{"ei", "ZORVA_DNSProtocolEndPoint", "-o"};
  const auto as = [&](const char* format) {
    Words all = words;
    all.emplace_back(format);
    return shown(host, all);
  };
  EXPECT_THAT(as("table"), testing::ContainsRegex("  InstallDate +-\n"));
  EXPECT_TRUE(contentOf(as("json"))[0]["properties"].at("InstallDate").is_null());
  EXPECT_THAT(as("mof"), HasSubstr("InstallDate = null;"));
  EXPECT_THAT(as("xml"), HasSubstr("<PROPERTY NAME=\"InstallDate\" TYPE=\"datetime\"></PROPERTY>"));
}

TEST(Enumerate, SaysWhichClassesAreLikeOneThatIsNot) {
  expectRefused(TestHost(), {"ei", "ZORVA_DNSProtocol"}, 2,
                "there is no class ZORVA_DNSProtocol\nzorvactl: did you mean ZORVA_DNSProtocolEndPoint?\n");
  for (const auto& [typed, meant] : {std::pair("ZORVA_DNSSetingData", "ZORVA_DNSSettingData"),
                                     std::pair("DNSOrderdComponent", "ZORVA_DNSOrderedComponent"),
                                     std::pair("CIM_ManagedElemnt", "CIM_ManagedElement")}) {
    expectRefused(TestHost(), {"ei", typed}, 2, std::string("zorvactl: did you mean ") + meant + "?\n");
  }
  expectRefused(TestHost(), {"ei", "ZORVA_DNSSettingData", "--property", "DomianName"}, 2,
                "has a property DomianName\nzorvactl: did you mean DomainName?\n");
  expectRefused(TestHost(), {"ei", "Frob"}, 2, "there is no class Frob\nzorvactl: zorvactl classes lists them\n");
}

TEST(Enumerate, ReportsAMissingProvider) {
  const TestHost host;
  const Outcome outcome = host.run({"ei", "ZORVA_DNSProtocolEndPoint", "-o", "json", "--provider-dir", "/nowhere"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(contentOf(outcome.out), IsEmpty()) << "what a program reads is complete all the same";
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("CIM_ERR_"), HasSubstr("libzorvadnsclientprofileprovider")));
}

TEST(Get, CompletesKeysAndSpellings) {
  const json found = jsonShown(TestHost(), {"gi", R"(zorva_dnsprotocolendpoint.name="eth0")"});
  EXPECT_EQ(found["path"],
            R"(//host1/root/cimv2:ZORVA_DNSProtocolEndPoint.SystemCreationClassName="ZORVA_ComputerSystem",)"
            R"(CreationClassName="ZORVA_DNSProtocolEndPoint",SystemName="host1",Name="eth0")");
}

TEST(Get, FindsTheOnlyInstanceByItsClassAlone) {
  EXPECT_EQ(jsonShown(TestHost(), {"gi", "CIM_DNSGeneralSettingData"})["properties"]["InstanceID"], "dnsgen1:host1");
}

TEST(Get, FindsAnAssociationByAPartOfItsReferences) {
  const json found = jsonShown(TestHost(), {"gi", R"(ZORVA_DNSEndPointElementSettingData.SettingData=)"
                                                  R"("ZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"")"});
  EXPECT_THAT(found["properties"]["ManagedElement"].get<std::string>(), HasSubstr("eth1"));
}

TEST(Get, ListsTheCandidatesIfThereAreSeveral) {
  expectRefused(TestHost(), {"gi", "ZORVA_DNSSettingData"}, 2,
                "2 instances fit ZORVA_DNSSettingData\nzorvactl: give more of the keys of one of them:\n"
                "  ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"\n"
                "  ZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"\n");
}

TEST(Get, ListsTheInstancesIfNothingFits) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSProtocolEndPoint.Name="eth9")"}, 1,
                "there is no instance ZORVA_DNSProtocolEndPoint.Name=\"eth9\"\nzorvactl: there are:\n");
}

TEST(Get, ReportsTheCodeOfAMissingInstance) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.InstanceID="nothing")"}, 1, "CIM_ERR_NOT_FOUND (6)");
}

TEST(Get, SuggestsTheNearestKey) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSProtocolEndPoint.Nmae="eth0")"}, 2, "\nzorvactl: did you mean Name?\n");
}

TEST(Get, RefusesAKeyThatTheClassLacks) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.Foo="x")"}, 2, "Foo");
}

TEST(Get, RefusesAPathOfAnotherHostAndMarksIt) {
  for (const char* subcommand : {"gi", "ai", "ain", "ri", "rin"}) {
    expectRefused(TestHost(), {subcommand, R"(//other/root/cimv2:ZORVA_DNSSettingData.InstanceID="Computer%eth0")"}, 2,
                  "names the host other at byte 3, and this is host1\n  //other/root/cimv2:ZOR...\n    ^\n");
  }
  expectRefused(TestHost(), {"ei", "//other/root/cimv2:ZORVA_DNSSettingData"}, 2, "names the host other");
  for (const char* host : {"host1", "HOST1", "localhost"}) {
    shown(TestHost(), {"gi", std::string("//") + host + R"(/root/cimv2:ZORVA_DNSProtocolEndPoint.Name="eth0")"});
  }
}

TEST(Get, RefusesANamespaceThatIsNot) {
  expectRefused(TestHost(), {"gi", R"(root/foo:ZORVA_DNSProtocolEndPoint.Name="eth0")"}, 2,
                "no namespace \"root/foo\"");
}

TEST(Get, RefusesAReferenceThatIsNoPath) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSHostedAccessPoint.Antecedent="x")"}, 2,
                "ZORVA_DNSHostedAccessPoint.Antecedent=\"x\": there is no class x\nzorvactl: a reference is the path");
  expectRefused(TestHost(), {"ain", R"(ZORVA_DNSHostedAccessPoint.Antecedent="a b",Dependent="y")"}, 2, "Antecedent");
  expectRefused(TestHost(), {"ri", "ZORVA_DNSHostedAccessPoint.Antecedent=5"}, 2, "5 is no ref");
}

TEST(Get, CompletesTheKeysOfReferencesThatAreIncomplete) {
  EXPECT_THAT(shown(TestHost(), {"gi", R"(ZORVA_DNSHostedAccessPoint.Antecedent="ZORVA_ComputerSystem",)"
                                       R"(Dependent="ZORVA_DNSProtocolEndPoint.Name=\"eth1\"")"}),
              HasSubstr(R"(Name="eth1")"));
}

TEST(Get, RefusesAPropertyThatTheClassLacks) {
  expectRefused(TestHost(), {"gi", kEndpoint, "--property", "Nope"}, 2,
                "neither ZORVA_DNSProtocolEndPoint nor a class below it has a property Nope");
  expectRefused(TestHost(), {"ai", kEndpoint, "--property", "No\x1Bpe"}, 2, "no class has a property No\\x1Bpe");
}

TEST(Get, RefusesAPathThatIsTooLong) {
  const std::string path = R"(ZORVA_DNSProtocolEndPoint.Name=")" + std::string(100000, 'x') + "\"";
  expectRefused(TestHost(), {"gi", path}, 2, "the path is 100033 bytes long; at most 65536 are read");
}

TEST(Get, MarksThePlaceWhereAPathIsWrong) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.InstanceID="x)"}, 2,
                "\n  ZORVA_DNSSettingData.InstanceID=\"x\n                                  ^\n");
  expectRefused(TestHost(), {"gi", R"(ZORVA_X.R="ZORVA_Y.K=\"a\"",)"}, 2, "^");
}

TEST(Get, ReadsPathsNestedInPaths) {
  std::string path = R"(ZORVA_DNSSettingData.InstanceID="x")";
  for (int depth = 0; depth < 6; ++depth) {
    std::string quoted;
    for (const char c : path) quoted += (c == '"' || c == '\\' ? "\\" : "") + std::string(1, c);
    path = "ZORVA_DNSEndPointElementSettingData.SettingData=\"" + quoted + "\"";
  }
  const Outcome outcome = TestHost().run({"gi", path});
  EXPECT_NE(outcome.exitCode, 0);
  EXPECT_LT(outcome.exitCode, 128) << outcome.err;
}

TEST(Get, WritesMofAndXml) {
  EXPECT_THAT(shown(TestHost(), {"gi", kEndpoint, "-o", "mof"}),
              AllOf(StartsWith("instance of ZORVA_DNSProtocolEndPoint {\n"), HasSubstr("  EnabledState = 2;\n")));
  EXPECT_THAT(shown(TestHost(), {"gi", kEndpoint, "-o", "xml"}),
              AllOf(StartsWith("<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<CIM "),
                    HasSubstr(R"(<PROPERTY NAME="EnabledState" TYPE="uint16"><VALUE>2</VALUE></PROPERTY>)"),
                    EndsWith("</CIM>\n")));
}

TEST(Enumerate, WritesXmlThatIsValid) {
  const TestHost host({TestHost::port("e\\u0001\\\"<th", R"("dns_suffixes": ["a&b", "]]>"])")});
  for (const char* name : {"CIM_ManagedElement", "CIM_Dependency", "CIM_Component", "ZORVA_SPComputerSystem"}) {
    EXPECT_EQ(cimxml::testing::grammarProblem(shown(host, {"ei", name, "-o", "xml"})), "") << name;
  }
}

TEST(Names, OfAnyBytesComeOutWhole) {
  const TestHost host({TestHost::port("\xF4\x8E\xBB\xBF")});  // the byte FF, as the agent's documents have it
  EXPECT_THAT(shown(host, {"ein", "ZORVA_DNSSettingData"}), HasSubstr("Computer%\\xFF"));
  EXPECT_EQ(jsonShown(host, {"ei", "ZORVA_DNSProtocolEndPoint"})[0]["properties"]["Name"], "\xF4\x8E\xBB\xBF");
}

}  // namespace
}  // namespace zorva::cli
