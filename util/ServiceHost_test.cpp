#include "util/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::util {
namespace {

using ::testing::Contains;
using ::testing::IsSupersetOf;
using ::testing::Not;

TEST(ServiceHost, KnowsItsNamesAndAddresses) {
  const ServiceHost host("web.example.org");
  for (const char* name : {"web.example.org", "WEB.example.org:5988", "web", "web.", "localhost", "localhost:1",
                           "localhost.localdomain", "127.0.0.1", "127.9.9.9:5989", "::1", "[::1]", "[::1]:5988"}) {
    EXPECT_TRUE(host.isThis(name, "")) << name;
  }
  for (const char* name : {"", "mail.example.org", "web.example.com", "192.0.2.99", "[2001:db8::99]:80", "[::1", ":"}) {
    EXPECT_FALSE(host.isThis(name, "")) << name;
  }
}

TEST(ServiceHost, IsWhatTheClientReachedItBy) {
  const ServiceHost host("web");
  EXPECT_TRUE(host.isThis("alias.example.net", "ALIAS.example.net:5988"));
  EXPECT_FALSE(host.isThis("other.example.net", "alias.example.net:5988"));
}

TEST(ServiceHost, HasTheNameThatTheKernelKnows) {
  char name[256] = {};
  ASSERT_EQ(gethostname(name, sizeof name - 1), 0);
  EXPECT_EQ(ServiceHost("").name(), name);
  EXPECT_TRUE(ServiceHost("given").isThis(name, ""));
}

TEST(OwnNames, AreThoseOfTheHostsFileForAnOwnAddress) {
  char kernel[256] = {};
  ASSERT_EQ(gethostname(kernel, sizeof kernel - 1), 0);
  const std::string name = kernel;
  const agent::testing::TemporaryDirectory directory;
  const std::string hosts = directory.write("hosts", "127.0.1.1\t" + name + ".example.org " + name +
                                                         " www # alias\n"
                                                         "192.0.2.9 " +
                                                         name + " elsewhere.example.org\n127.0.0.1 other\n\n#");
  const std::vector<std::string> names = ownNames(hosts);
  EXPECT_THAT(names, IsSupersetOf({name, std::string("localhost"), name + ".example.org", std::string("www")}));
  EXPECT_THAT(names, Not(Contains("elsewhere.example.org")));
  EXPECT_THAT(names, Not(Contains("other")));
}

TEST(OwnNames, OfAnUnreadableHostsFileAreTheKernels) { EXPECT_THAT(ownNames("/no/such/file"), Contains("localhost")); }

TEST(OwnAddresses, AreAddressesOfThisHost) {
  EXPECT_THAT(ownAddresses(), Contains("127.0.0.1"));
  for (const std::string& each : ownAddresses()) EXPECT_TRUE(isOwnAddress(each)) << each;
  for (const char* other : {"192.0.2.99", "localhost", "", "2001:db8::99"}) EXPECT_FALSE(isOwnAddress(other)) << other;
}

}  // namespace
}  // namespace zorva::util
