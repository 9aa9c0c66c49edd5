#include "util/ServiceHost.h"

#include <gtest/gtest.h>
#include <unistd.h>

namespace zorva::util {
namespace {

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

}  // namespace
}  // namespace zorva::util
