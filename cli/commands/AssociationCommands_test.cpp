#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Associators, AreThoseOfTheResultClass) {
  const json found = jsonShown(TestHost(), {"ai", kEndpoint, "--result-class", "CIM_RemoteServiceAccessPoint"});
  ASSERT_EQ(found.size(), 2U);
  EXPECT_EQ(found[0]["properties"]["Name"], "192.0.2.53");
}

TEST(Associators, AreThoseThroughTheAssociationAndTheRoles) {
  const auto count = [](const Words& filter) {
    Words words{"ain", kEndpoint};
    words.insert(words.end(), filter.begin(), filter.end());
    return jsonShown(TestHost(), words).size();
  };
  EXPECT_EQ(count({"--assoc-class", "zorva_remoteaccessavailabletoelement"}), 2U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--role", "Dependent"}), 2U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--role", "Antecedent"}), 0U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--result-role", "Antecedent"}), 2U);
}

TEST(Associators, RefuseAClassThatIsNot) {
  expectRefused(TestHost(), {"ai", kEndpoint, "--result-class", "CIM_Nothing"}, 2, "there is no class CIM_Nothing");
  expectRefused(TestHost(), {"ri", kEndpoint, "--result-class", "CIM_Nothing"}, 2, "there is no class CIM_Nothing");
}

TEST(Associators, RefuseWhatNoAssociationCanMean) {
  const TestHost host;
  expectRefused(host, {"ai", kEndpoint, "--assoc-class", "ZORVA_DNSSettingData"}, 2,
                "ZORVA_DNSSettingData is no association");
  expectRefused(host, {"ain", "ZORVA_DNSGeneralSettingData", "--assoc-class", "ZORVA_RemoteAccessAvailableToElement"},
                2,
                "ZORVA_DNSGeneralSettingData is at no end of ZORVA_RemoteAccessAvailableToElement\n"
                "zorvactl: its ends are Antecedent (ZORVA_RemoteServiceAccessPoint) and Dependent (");
  expectRefused(host, {"ri", R"(ZORVA_DNSHostedAccessPoint.Dependent="ZORVA_DNSProtocolEndPoint.Name=\"eth0\"")"}, 2,
                "ZORVA_DNSHostedAccessPoint is at no end of any association");
  expectRefused(host, {"rin", kEndpoint, "--role", "fr\x1Bob"}, 2,
                "--role: no association that is meant has a reference fr\\x1Bob\nzorvactl: there are ");
  expectRefused(host, {"ain", kEndpoint, "--result-role", "Nobody"}, 2, "--result-role: no association");
}

TEST(Associators, WantASourceThatIsClear) {
  expectRefused(TestHost(), {"ain", "ZORVA_DNSProtocolEndPoint"}, 2, "2 instances fit ZORVA_DNSProtocolEndPoint");
  expectRefused(TestHost(), {"ain", R"(ZORVA_DNSProtocolEndPoint.Name="eth9")"}, 1, "there is no instance");
}

TEST(References, AreTheAssociationsThemselves) {
  const json names = jsonShown(TestHost(), {"rin", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")"});
  EXPECT_EQ(names.size(), 2U);
  const json found = jsonShown(TestHost(), {"ri", kEndpoint, "--result-class", "ZORVA_DNSHostedAccessPoint"});
  ASSERT_EQ(found.size(), 1U);
  EXPECT_EQ(found[0]["class"], "ZORVA_DNSHostedAccessPoint");
}

}  // namespace
}  // namespace zorva::cli
