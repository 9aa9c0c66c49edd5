#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(CompletionScript, AsksTheProgramForClassesAndInterfaces) {
  const TestHost host;
  EXPECT_THAT(shown(host, {"completion", "bash"}), HasSubstr("complete -F _zorvactl zorvactl"));
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "dns", "set", "eth"}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "dns", "set", "--url", "http://other", "eth"}), "");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "ei", "zorva_dnsgeneralS"}), "ZORVA_DNSGeneralSettingData\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "ov"}), "overlay\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "modify", "--dr"}), "--dry-run\n");
  EXPECT_EQ(shown(host, {"complete", "bash"}), "");
}

TEST(CompletionScript, KnowsWhatBelongsToAClass) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "modify", R"('ZORVA_DNSSettingData.InstanceID="x"')", "domain"}),
            "DomainName=\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSD"}), "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSDomain", ""}),
            "DNSDomain=\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "ei", "ZORVA_DNSSettingData", "--property", "domain"}),
            "DomainName\n");
  EXPECT_THAT(shown(host, {"complete", "bash", "--", "ain", "ZORVA_RemoteServiceAccessPoint", "--role", ""}),
              StartsWith("Antecedent\nDependent\n"));
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "graph", "-o", ""}), "table\njson\ndot\nsvg\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "completion", ""}), "bash\nzsh\nfish\n");
}

TEST(CompletionScript, PutsTogetherTheWordsThatBashTookApart) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "show", "--output", "=", "j"}), "json\n");
  EXPECT_EQ(
      shown(host, {"complete", "bash", "--", "cm", "'ZORVA_DNSProtocolEndPoint.Name", "=", "\"eth0\"'", "SetDNSD"}),
      "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "gi", "ZORVA_DNSProtocolEndPoint.Name", "="}), "");
}

TEST(CompletionScript, KnowsObjectPathsOnceTheClassIsThere) {
  const TestHost host;
  const std::string eth0 = "ZORVA_DNSProtocolEndPoint.Name=\"eth0\"\n";
  const std::string eth1 = "ZORVA_DNSProtocolEndPoint.Name=\"eth1\"\n";
  EXPECT_EQ(shown(host, {"complete", "zsh", "--", "gi", "zorva_dnsprotocolendpoint."}), eth0 + eth1);
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "gi", "'ZORVA_DNSProtocolEndPoint.Name=\"eth1"}), eth1);
  EXPECT_THAT(shown(host, {"complete", "fish", "--", "gi", "ZORVA_DNSGeneralSettingData."}),
              HasSubstr("ZORVA_DNSGeneralSettingData.InstanceID="))
      << "the only one keeps its keys";
  EXPECT_EQ(shown(host, {"complete", "zsh", "--", "--url", "https://other", "gi", "ZORVA_DNSProtocolEndPoint."}), "");
}

TEST(CompletionScript, AsksTheShellForFiles) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "show", "--config", ""}), ":files\n");
  EXPECT_EQ(shown(host, {"complete", "zsh", "--", "show", "--config=x"}), ":files\n");
  EXPECT_EQ(shown(host, {"complete", "fish", "--", "show", "--provider-dir", "/"}), ":directories\n");
}

TEST(CompletionScript, HasMeaningsForShellsThatShowThem) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "fish", "--", "confir"}),
            "confirm\tKeep the settings that 'apply --confirm' has on trial\n");
  EXPECT_EQ(shown(host, {"complete", "zsh", "--", "show", "--output=j"}), "--output=json\n");
  EXPECT_THAT(shown(host, {"complete", "fish", "--", "modify", "--dr"}), StartsWith("--dry-run\tShow what"));
  EXPECT_EQ(shown(host, {"complete", "fish", "--", "help", "agent"}), "agent.toml\n");
}

TEST(CompletionScript, KnowsInterfacesThatAreGoneAndHaveAFile) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth0", "");
  host.directory().write("data/ifcfg-gone0", "");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "ifcfg", "adopt", ""}), "gone0\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "ifcfg", "adopt", "gone0", ""}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "check", "eth"}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "bash", "--", "show", "eth0", "eth1"}), "eth1\n");
}

}  // namespace
}  // namespace zorva::cli
