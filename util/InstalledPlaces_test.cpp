#include "util/InstalledPlaces.h"

#include <gtest/gtest.h>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::util {
namespace {

using zorva::agent::testing::TemporaryDirectory;

TEST(InstalledPlaces, ArePartOfThePrefixOfProgramsAndLibraries) {
  const TemporaryDirectory prefix;
  prefix.write("etc/zorvagent/agent.toml", "");
  for (const char* file : {"bin/zorvactl", "sbin/zorvacimd", "lib/libzorvagent.so.1", "lib64/libzorvagent.so.1",
                           "lib/x86_64-linux-gnu/libzorvagent.so.1"}) {
    const InstalledPlaces places = placesOf(prefix / file);
    EXPECT_EQ(places.config, prefix / "etc/zorvagent/") << file;
    EXPECT_EQ(places.data, prefix / "var/lib/zorvagent/") << file;
  }
}

TEST(InstalledPlaces, AreThoseOfTheSystemWherePrefixHasNoConfiguration) {
  const TemporaryDirectory prefix;
  EXPECT_EQ(placesOf(prefix / "bin/zorvactl").config, "/etc/zorvagent/");
  EXPECT_EQ(placesOf(prefix / "bin/zorvactl").data, "/var/lib/zorvagent/");
}

TEST(InstalledPlaces, AreThoseOfTheSystemForDirectoriesThatAreNoPartOfAPrefix) {
  const TemporaryDirectory above;
  above.write("etc/zorvagent/agent.toml", "");
  for (const char* file : {"build/zorvactl", "zorvactl", "opt/bin/inner/zorvactl", "opt/sub/libzorvagent.so.1"}) {
    EXPECT_EQ(placesOf(above / file).config, "/etc/zorvagent/") << file;
  }
}

TEST(InstalledPlaces, AreThoseOfTheSystemForUsr) {
  EXPECT_EQ(placesOf("/usr/bin/zorvactl").config, "/etc/zorvagent/");
  EXPECT_EQ(placesOf("/usr/lib/x86_64-linux-gnu/libzorvagent.so.1").data, "/var/lib/zorvagent/");
  EXPECT_EQ(placesOf("").config, "/etc/zorvagent/");
}

}  // namespace
}  // namespace zorva::util
