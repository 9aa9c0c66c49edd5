// zorvactl on hosts with very many interfaces.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>

#include <map>
#include <nlohmann/json.hpp>
#include <regex>
#include <sstream>

#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

using testing::Each;

/// The processor time in seconds that children of this process have used.
double secondsOfChildren() {
  rusage usage{};
  ::getrusage(RUSAGE_CHILDREN, &usage);
  const auto seconds = [](const timeval& time) {
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
  };
  return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

double secondsOf(const TestHost& host, const char* command) {
  const double before = secondsOfChildren();
  EXPECT_EQ(host.run({command}).exitCode, 0) << command;
  return secondsOfChildren() - before;
}

TEST(ManyInterfaces, EightTimesAsManyTakeAboutEightTimesAsLong) {
  const TestHost some(TestHost::manyInterfaces(600));
  const TestHost many(TestHost::manyInterfaces(4800));
  for (const char* command : {"show", "classes", "graph"}) {
    EXPECT_LT(secondsOf(many, command), 24 * secondsOf(some, command)) << command;
  }
}

std::vector<json> countsOfAssociations(const TestHost& host, const std::vector<std::string>& words) {
  std::vector<json> counts;
  for (const json& row : contentOf(host.run(words).out)) {
    const std::string name = row["class"];
    const bool isAssociation = name.ends_with("Element") || name.ends_with("Dependency") ||
                               name.ends_with("ElementSettingData") || name.ends_with("OrderedComponent") ||
                               name.ends_with("HostedAccessPoint");
    if (isAssociation) counts.push_back(row["instances"]);
  }
  EXPECT_EQ(counts.size(), 8U);
  return counts;
}

TEST(ManyInterfaces, AssociationsAreCountedOnlyIfThatIsAskedFor) {
  const TestHost host(TestHost::manyInterfaces(501));
  EXPECT_THAT(countsOfAssociations(host, {"classes", "-o", "json"}), Each(json(nullptr)));
  EXPECT_THAT(countsOfAssociations(host, {"classes", "-o", "json", "--all"}), Each(testing::Ne(json(nullptr))));
  EXPECT_EQ(
      host.run({"classes"}).err,
      "zorvactl: note: the associations of so many objects are not counted; --all counts them, which takes long\n");
  EXPECT_EQ(host.run({"show"}).err, "");
}

/// The operations that the providers log at their entry.
std::map<std::string, int> operationsOf(const TestHost& host, const char* command) {
  std::map<std::string, int> counts;
  std::istringstream lines(host.run({command, "--log-level", "3000"}).err);
  const std::regex operation(R"(ENTERING: (\w+_(Enum|Get|Associat|Referenc)\w*)\(\) in providers/)");
  for (std::string line; std::getline(lines, line);) {
    std::smatch found;
    if (std::regex_search(line, found, operation)) ++counts[found[1]];
  }
  return counts;
}

TEST(ManyInterfaces, ShowAsksTheProvidersNoMoreOftenThanWithFew) {
  const std::map<std::string, int> few = operationsOf(TestHost(), "show");
  EXPECT_EQ(operationsOf(TestHost(TestHost::manyInterfaces(200)), "show"), few);
  EXPECT_EQ(few.size(), 3U) << "the endpoints, the settings of the interfaces and of the host";
  for (const auto& [name, count] : few) EXPECT_THAT(name, EndsWith("_EnumInstances")) << count;
}

TEST(ManyInterfaces, AGraphFollowsTheFirstObjectsAndSaysSo) {
  const TestHost host(TestHost::manyInterfaces(600));
  const Outcome outcome = host.run({"graph"});
  EXPECT_EQ(outcome.exitCode, 0);
  // Not as matchers: the text is long.
  EXPECT_NE(outcome.out.find("ZORVA_DNSHostedAccessPoint -> Dependent  ZORVA_DNSProtocolEndPoint eth599"),
            std::string::npos);
  EXPECT_NE(outcome.out.find("Every reference that could be asked for leads to an object."), std::string::npos);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("zorvactl: note: of this many objects "), HasSubstr("--all asks all")));
}

TEST(ManyInterfaces, ALineSaysWhatTakesLongAndIsErased) {
  const TestHost host(TestHost::manyInterfaces(1500));
  const Outcome outcome = host.run({"classes", "--all"}, OutputTo::ErrorTerminal);
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("counting ZORVA_DNS"), EndsWith("\r\033[K")));
  EXPECT_EQ(outcome.out.find("counting"), std::string::npos);
}

TEST(Show, HasInterfacesInTheOrderOfTheirNames) {
  const TestHost host({TestHost::port("eth2"), TestHost::port("eth10"), TestHost::port("eth1")});
  const json view = contentOf(host.run({"show", "-o", "json"}).out);
  std::vector<std::string> names;
  for (const json& row : view["interfaces"]) names.push_back(row["name"]);
  EXPECT_THAT(names, testing::ElementsAre("eth1", "eth10", "eth2"));
}

}  // namespace
}  // namespace zorva::cli
