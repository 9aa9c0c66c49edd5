#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(CompletionScript, AsksTheProgramForClassesAndInterfaces) {
  const TestHost host;
  EXPECT_THAT(shown(host, {"completion", "bash"}), HasSubstr("complete -o default -F _zorvactl zorvactl"));
  EXPECT_EQ(shown(host, {"complete", "--", "dns", "set", "eth"}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "--", "dns", "set", "--url", "http://other", "eth"}), "");
  EXPECT_EQ(shown(host, {"complete", "--", "ei", "zorva_dnsgeneralS"}), "ZORVA_DNSGeneralSettingData\n");
  EXPECT_EQ(shown(host, {"complete", "--", "ov"}), "overlay\n");
  EXPECT_EQ(shown(host, {"complete", "--", "modify", "--dr"}), "--dry-run\n");
  EXPECT_EQ(shown(host, {"complete"}), "");
}

TEST(CompletionScript, KnowsWhatBelongsToAClass) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "--", "modify", R"('ZORVA_DNSSettingData.InstanceID="x"')", "domain"}),
            "DomainName=\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSD"}), "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSDomain", ""}), "DNSDomain=\n");
  EXPECT_EQ(shown(host, {"complete", "--", "ei", "ZORVA_DNSSettingData", "--property", "domain"}), "DomainName\n");
  EXPECT_THAT(shown(host, {"complete", "--", "ain", "ZORVA_RemoteServiceAccessPoint", "--role", ""}),
              StartsWith("Antecedent\nDependent\n"));
  EXPECT_EQ(shown(host, {"complete", "--", "graph", "-o", ""}), "table\njson\ndot\nsvg\n");
  EXPECT_EQ(shown(host, {"complete", "--", "completion", ""}), "bash\n");
}

TEST(CompletionScript, PutsTogetherTheWordsThatBashTookApart) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "--", "show", "--output", "=", "j"}), "json\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "'ZORVA_DNSProtocolEndPoint.Name", "=", "\"eth0\"'", "SetDNSD"}),
            "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "--", "gi", "ZORVA_DNSProtocolEndPoint.Name", "="}), "");
}

TEST(CompletionScript, IsTheOneThatIsInstalled) {
  EXPECT_EQ(shown(TestHost(), {"completion", "bash"}),
            zorva::agent::testing::contentsOf(ZORVA_SOURCE_DIR "/cli/zorvactl.bash"));
}

TEST(CompletionScript, WorksInBash) {
  if (std::system("command -v bash >/dev/null") != 0) GTEST_SKIP() << "there is no bash";
  const std::string script = "source <(" ZORVA_BIN_DIR "/zorvactl completion bash); COMP_WORDS=(" ZORVA_BIN_DIR
                             "/zorvactl tre); COMP_CWORD=1; _zorvactl; [ \"${COMPREPLY[*]}\" = tree ]";
  EXPECT_EQ(std::system(("bash -c '" + script + "'").c_str()), 0);
}

TEST(CompletionScript, KnowsInterfacesThatAreGoneAndHaveAFile) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth0", "");
  host.directory().write("data/ifcfg-gone0", "");
  EXPECT_EQ(shown(host, {"complete", "--", "ifcfg", "adopt", ""}), "gone0\n");
  EXPECT_EQ(shown(host, {"complete", "--", "ifcfg", "adopt", "gone0", ""}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "--", "check", "eth"}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "--", "show", "eth0", "eth1"}), "eth1\n");
}

}  // namespace
}  // namespace zorva::cli
