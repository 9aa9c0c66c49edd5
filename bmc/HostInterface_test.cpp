#include "bmc/HostInterface.h"

#include <gtest/gtest.h>

#include "agent/testing/TemporaryDirectory.h"
#include "bmc/testing/TestFirmware.h"

namespace zorva::bmc {
namespace {

using namespace std::string_literals;

using testing::controller;
using testing::record;
using testing::structure;

const std::string kBios = structure(0, "\1\2\3"s, "maker\0version\0\0"s);
const std::string kEnd = structure(127, "");
const std::string kIPv4 = "\xA9\xFE\x00\x11"s;

TEST(HostInterface, IsTheAddressAndPortInTheStructureOfType42) {
  EXPECT_EQ(findHostInterface(kBios + controller(record(1, kIPv4, 443)) + kEnd), "https://169.254.0.17:443");
  const std::string ipv6 = "\x20\x01\x0D\xB8"s + std::string(11, '\0') + "\x01";
  EXPECT_EQ(findHostInterface(kBios + controller(record(2, ipv6, 8443)) + kEnd), "https://[2001:db8::1]:8443");
}

TEST(HostInterface, OtherStructuresNameNone) {
  for (const std::string& table :
       {std::string(), kBios + kEnd, kBios + kEnd + controller(record(1, kIPv4, 443)),
        controller(record(1, kIPv4, 443), 2), controller(record(1, kIPv4, 443), 4, 2),
        controller(record(1, std::string(4, '\0'), 443)), controller(record(1, kIPv4, 0)),
        controller(record(3, kIPv4, 443)), controller(record(1, kIPv4, 443).substr(0, 90))}) {
    EXPECT_EQ(findHostInterface(table), std::nullopt);
  }
  EXPECT_EQ(findHostInterface(controller("short") + controller(record(1, kIPv4, 443))), "https://169.254.0.17:443");
}

TEST(HostInterface, ATableThatEndsAnywhereOrHasAnyLengthIsSafe) {
  const std::string whole = kBios + controller(record(1, kIPv4, 443)) + kEnd;
  for (std::size_t length = 0; length < whole.size(); ++length) findHostInterface(whole.substr(0, length));
  for (std::size_t place = 0; place < whole.size(); ++place) {
    for (const int value : {0, 1, 3, 4, 127, 255}) {
      std::string changed = whole;
      changed[place] = static_cast<char>(value);
      findHostInterface(changed);
    }
  }
}

TEST(HostInterface, AFileThatIsNotThereNamesNone) {
  const agent::testing::TemporaryDirectory directory;
  EXPECT_EQ(readHostInterface(directory / "DMI"), std::nullopt);
  EXPECT_EQ(readHostInterface(directory.write("DMI", controller(record(1, kIPv4, 443)))), "https://169.254.0.17:443");
}

}  // namespace
}  // namespace zorva::bmc
