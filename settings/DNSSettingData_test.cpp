#include "settings/DNSSettingData.h"

#include "settings/testing/FileAtEachLine.h"
#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kAllKeys =
    "BOOTPROTO=dhcp\nDOMAINNAME=file.example.org\nHOSTNAME=filehost\nCONFIG_NAME=office\nDNSSERVERS=192.0.2.1 "
    "2001:db8::1 \n";

class DNSSettingDataTest : public ::testing::Test {
 protected:
  // The cursor at the n-th interface, as a walk gets there.
  DNSSettingData at(std::size_t n) {
    world_.install();
    DNSSettingData data;
    for (; n > 0 && data; --n) ++data;
    EXPECT_TRUE(static_cast<bool>(data));
    return data;
  }
  DNSSettingData atUsualNic() {
    world_.nic("eth0", usualNic());
    return at(0);
  }

  World world_;
};

using Text = bool (DNSSettingData::*)(std::string&);

// The result of a getter, with its output: "before" if it was not changed.
std::pair<bool, std::string> get(DNSSettingData data, Text getter) {
  std::string value = "before";
  const bool given = (data.*getter)(value);
  return {given, value};
}
const std::pair<bool, std::string> kUntouched = {false, "before"};

std::string logged(const std::string& name, const std::string& value) {
  return "Zorvagent.DNSSettingDataProvider 4000 VARIABLE " + name + " = " + value;
}

// --- walking

TEST_F(DNSSettingDataTest, IsOnNoNodeIfThereIsNoInterface) {
  world_.host().install();
  DNSSettingData data;
  EXPECT_FALSE(static_cast<bool>(data));
  EXPECT_EQ("", data.getFileName());
}

TEST_F(DNSSettingDataTest, KnowsNoFileBeforeItWasAsked) {
  world_.nic("eth0").install();
  EXPECT_EQ("", DNSSettingData().getFileName());
}

TEST_F(DNSSettingDataTest, WalksOverAllInterfacesThoseOfTheServiceProcessorToo) {
  world_.host().nic("eth0").nic("eth1").bmc().nic("bmc0").install();
  std::vector<std::string> found;
  for (DNSSettingData data; data; ++data) found.push_back(get(data, &DNSSettingData::getInstanceID).second);
  EXPECT_THAT(found, ElementsAre("Computer%eth0", "Computer%eth1", "BMC%bmc0"));
}

TEST_F(DNSSettingDataTest, TestingTheCursorFindsTheFileAndLogsIt) {
  world_.nic("eth0").nic("eth1").install();
  const RecordingLogger logger;
  for (DNSSettingData data; data; ++data) {
  }
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(),
              ElementsAre(logged("fileName", world_.filePath("eth0")), logged("fileName", world_.filePath("eth1"))));
  EXPECT_EQ("operator bool", lines.at(0).function);
  EXPECT_EQ("settings/DNSSettingData.cpp", lines.at(0).file);
}

TEST_F(DNSSettingDataTest, ANodeWithoutANameCountsAndKeepsTheFileOfTheOneBefore) {
  world_.nic("", {.isUnnamed = true}).nic("eth0").nic("x", {.isUnnamed = true}).install();
  DNSSettingData data;
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_EQ("", data.getFileName());
  EXPECT_EQ(kUntouched, get(data, &DNSSettingData::getInstanceID));
  EXPECT_EQ(kUntouched, get(data, &DNSSettingData::getElementName));
  ++data;
  EXPECT_TRUE(static_cast<bool>(data));
  ++data;
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_EQ(world_.filePath("eth0"), data.getFileName());
  EXPECT_EQ(kUntouched, get(data, &DNSSettingData::getInstanceID));
  EXPECT_EQ(kUntouched, get(data, &DNSSettingData::getElementName));
}

TEST_F(DNSSettingDataTest, ANodeWithoutANameReadsTheFileOfTheOneBefore) {
  world_.nic("eth0").nic("x", {.domain = "node.example.org", .isUnnamed = true});
  world_.file("eth0", kAllKeys);
  EXPECT_EQ(std::pair(true, "file.example.org"s), get(at(1), &DNSSettingData::getDomainName));
}

TEST_F(DNSSettingDataTest, AnEmptyNameHasAFileOfItsOwn) {
  world_.nic("");
  EXPECT_EQ(world_.dataDir() + "ifcfg-", at(0).getFileName());
}

TEST_F(DNSSettingDataTest, ACopyIsOnTheSameNodeAndMovesOnItsOwn) {
  world_.nic("eth0").nic("eth1").install();
  DNSSettingData data;
  EXPECT_TRUE(static_cast<bool>(data));
  DNSSettingData copy = data;
  ++data;
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_EQ(world_.filePath("eth0"), copy.getFileName());
  EXPECT_EQ("Computer%eth0", get(copy, &DNSSettingData::getInstanceID).second);
  EXPECT_EQ("Computer%eth1", get(data, &DNSSettingData::getInstanceID).second);
  ++copy;
  ++copy;
  EXPECT_FALSE(static_cast<bool>(copy));
  EXPECT_TRUE(static_cast<bool>(data));
}

TEST_F(DNSSettingDataTest, ATreeThatCannotBeReadLeavesTheConstructorAndTheLogAsTheyAre) {
  world_.installUnreadable();
  const RecordingLogger logger;
  EXPECT_THROW(DNSSettingData(), std::runtime_error);
  EXPECT_EQ(0U, logger.size());
}

TEST_F(DNSSettingDataTest, WhateverTheTreeThrowsFliesOn) {
  world_.nic("eth0", usualNic()).install();
  std::size_t flown = 0;
  const std::size_t tried = forEachTreeFailure([&flown](std::size_t, Thrown thrown) {
    try {
      for (DNSSettingData data; data; ++data) {
        std::string text;
        std::vector<std::string> texts;
        data.getInstanceID(text);
        data.getElementName(text);
        data.getDomainName(text);
        data.getDNSServerAddresses(texts);
      }
    } catch (const std::exception&) {
      flown += thrown == Thrown::StdException ? 1U : 0U;
    } catch (int) {
      flown += thrown == Thrown::Int ? 1U : 0U;
    }
  });
  EXPECT_GT(tried, 20U);
  EXPECT_EQ(tried, flown);
}

// --- identity

TEST_F(DNSSettingDataTest, TheGrandparentsDescriptionChoosesThePrefix) {
  for (const auto& [description, prefix] :
       {std::pair("BMC", "BMC%"), std::pair("bmc", "Computer%"), std::pair("Computer", "Computer%"),
        std::pair("BMC ", "Computer%"), std::pair("", "Computer%"), std::pair("PowerEdge", "Computer%")}) {
    World world;
    world.system("system", description).nic("eth0").install();
    DNSSettingData data;
    EXPECT_TRUE(static_cast<bool>(data));
    EXPECT_EQ(std::pair(true, prefix + "eth0"s), get(data, &DNSSettingData::getInstanceID)) << description;
  }
}

TEST_F(DNSSettingDataTest, AnEmptyNameGivesThePrefixAlone) {
  world_.nic("");
  EXPECT_EQ(std::pair(true, "Computer%"s), get(at(0), &DNSSettingData::getInstanceID));
}

TEST_F(DNSSettingDataTest, TheCursorStaysWhileItsSystemIsLookedUp) {
  world_.nic("eth0").nic("eth1");
  DNSSettingData data = at(0);
  get(data, &DNSSettingData::getInstanceID);
  EXPECT_EQ(std::pair(true, "DNSSettingData.eth0"s), get(data, &DNSSettingData::getElementName));
  ++data;
  EXPECT_EQ(std::pair(true, "DNSSettingData.eth1"s), get(data, &DNSSettingData::getElementName));
}

// --- constants

TEST_F(DNSSettingDataTest, CaptionDescriptionAndOriginAreConstants) {
  DNSSettingData data = atUsualNic();
  EXPECT_EQ(std::pair(true, "DNS Setting Configuration"s), get(data, &DNSSettingData::getCaption));
  EXPECT_EQ(std::pair(true, "Represents DNS Setting Configuration for DNS Protocol EndPoint"s),
            get(data, &DNSSettingData::getDescription));
  unsigned short origin = 77;
  EXPECT_TRUE(data.getAddressOrigin(origin));
  EXPECT_EQ(2, origin);
}

TEST_F(DNSSettingDataTest, TheAddressOriginHasNoLinkToTheBootProtocol) {
  world_.file("eth0", "BOOTPROTO=dhcp\n");
  unsigned short origin = 77;
  EXPECT_TRUE(atUsualNic().getAddressOrigin(origin));
  EXPECT_EQ(2, origin);
}

TEST_F(DNSSettingDataTest, DHCPOptionsAreAppended) {
  std::vector<unsigned short> options = {1, 2};
  EXPECT_TRUE(atUsualNic().getDHCPOptionsToUse(options));
  EXPECT_THAT(options, ElementsAre(1, 2, 8, 14, 17));
}

TEST_F(DNSSettingDataTest, UseOfTheSuffixIsReturnedAndLeavesTheOutputUnchanged) {
  DNSSettingData data = atUsualNic();
  for (const bool before : {false, true}) {
    bool value = before;
    EXPECT_TRUE(data.getUseSuffixWhenRegistering(value));
    EXPECT_EQ(before, value);
  }
}

TEST_F(DNSSettingDataTest, RegistrationOfTheAddressIsNeverReturnedAndLeavesTheOutputUnchanged) {
  DNSSettingData data = atUsualNic();
  for (const bool before : {false, true}) {
    bool value = before;
    EXPECT_FALSE(data.getRegisterThisConnectionsAddress(value));
    EXPECT_EQ(before, value);
  }
}

// --- file or node

struct Scalar {
  const char* label;
  Text getter;
  const char* key;
  const char* inFile;
  std::pair<bool, std::string> fromNode;      // of a usual interface without a file
  std::pair<bool, std::string> fromBareNode;  // of an interface with nothing but a name
  const char* variable;                       // its name in the log
};

const Scalar kScalars[] = {
    {"BootProtocol", &DNSSettingData::getBootProtocol, "BOOTPROTO", "dhcp", kUntouched, kUntouched, "bootProtocol"},
    {"DomainName",
     &DNSSettingData::getDomainName,
     "DOMAINNAME",
     "file.example.org",
     {true, "example.org"},
     {false, ""},
     "domainName"},
    {"RequestedHostname",
     &DNSSettingData::getRequestedHostname,
     "HOSTNAME",
     "filehost",
     {true, "host1"},
     {false, ""},
     "requestedHostname"},
    {"ConfigurationName", &DNSSettingData::getConfigurationName, "CONFIG_NAME", "office", kUntouched, kUntouched,
     "configurationName"},
};

class ScalarSource : public DNSSettingDataTest, public ::testing::WithParamInterface<Scalar> {};

TEST_P(ScalarSource, IsTheFileIfThereIsOne) {
  world_.file("eth0", kAllKeys);
  EXPECT_EQ(std::pair(true, std::string(GetParam().inFile)), get(atUsualNic(), GetParam().getter));
}

TEST_P(ScalarSource, IsTheFileEvenIfItLacksTheKey) {
  world_.file("eth0", "ONBOOT=yes\n");
  EXPECT_EQ(std::pair(true, ""s), get(atUsualNic(), GetParam().getter));
}

TEST_P(ScalarSource, IsTheFileEvenIfItsValueIsEmpty) {
  world_.file("eth0", GetParam().key + "=\n"s);
  EXPECT_EQ(std::pair(true, ""s), get(atUsualNic(), GetParam().getter));
}

TEST_P(ScalarSource, IsTheNodeOrNothingIfThereIsNoFile) {
  EXPECT_EQ(GetParam().fromNode, get(atUsualNic(), GetParam().getter));
}

TEST_P(ScalarSource, IsNothingIfTheNodeLacksItToo) {
  world_.nic("eth0");
  EXPECT_EQ(GetParam().fromBareNode, get(at(0), GetParam().getter));
}

TEST_P(ScalarSource, OfTheFileIsLogged) {
  world_.file("eth0", kAllKeys);
  DNSSettingData data = atUsualNic();
  const RecordingLogger logger;
  get(data, GetParam().getter);
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(), ElementsAre(logged(GetParam().variable, GetParam().inFile)));
  EXPECT_EQ("get"s + GetParam().label, lines.at(0).function);
}

TEST_P(ScalarSource, OfTheNodeIsNotLogged) {
  DNSSettingData data = atUsualNic();
  const RecordingLogger logger;
  get(data, GetParam().getter);
  EXPECT_EQ(0U, logger.size());
}

INSTANTIATE_TEST_SUITE_P(DNSSettingData, ScalarSource, ::testing::ValuesIn(kScalars),
                         [](const auto& scalar) { return scalar.param.label; });

class ServerSource : public DNSSettingDataTest {
 protected:
  std::pair<bool, std::vector<std::string>> servers() {
    DNSSettingData data = at(0);
    std::vector<std::string> values;
    const bool given = data.getDNSServerAddresses(values);
    return {given, values};
  }
};

TEST_F(ServerSource, IsTheFileIfThereIsOne) {
  world_.nic("eth0", usualNic()).file("eth0", kAllKeys);
  EXPECT_EQ(std::pair(true, std::vector<std::string>{"192.0.2.1", "2001:db8::1"}), servers());
}

TEST_F(ServerSource, IsTheFileEvenIfItLacksTheKeyOrHasNoElement) {
  world_.nic("eth0", usualNic()).file("eth0", "");
  EXPECT_EQ(std::pair(true, std::vector<std::string>()), servers());
  world_.file("eth0", "DNSSERVERS=  \n");
  EXPECT_EQ(std::pair(true, std::vector<std::string>()), servers());
}

TEST_F(ServerSource, IsTheNodeIfThereIsNoFile) {
  world_.nic("eth0", usualNic());
  EXPECT_EQ(std::pair(true, std::vector<std::string>{"192.0.2.53"}), servers());
}

TEST_F(ServerSource, IsNothingIfTheNodeLacksItToo) {
  world_.nic("eth0");
  EXPECT_EQ(std::pair(false, std::vector<std::string>()), servers());
}

TEST_F(ServerSource, ClearsTheOutputIfTheNodeLacksItToo) {
  world_.nic("eth0");
  std::vector<std::string> values = {"before"};
  EXPECT_FALSE(at(0).getDNSServerAddresses(values));
  EXPECT_THAT(values, IsEmpty());
}

TEST_F(ServerSource, IsNotLogged) {
  world_.nic("eth0").file("eth0", kAllKeys);
  DNSSettingData data = at(0);
  const RecordingLogger logger;
  std::vector<std::string> values;
  data.getDNSServerAddresses(values);
  EXPECT_EQ(0U, logger.size());
}

// --- setters

TEST_F(DNSSettingDataTest, SettersOfTheNodeStoreAndLeaveTheFile) {
  world_.file("eth0", kAllKeys);
  DNSSettingData data = atUsualNic();
  EXPECT_TRUE(data.setRequestedHostname("newhost"));
  EXPECT_TRUE(data.setDomainName("new.example.org"));
  EXPECT_TRUE(data.setDNSServerAddresses({"192.0.2.9"}));
  EXPECT_THAT(world_.text(0, NodeLexicon::PROP_HOST_NAME), Optional("newhost"s));
  EXPECT_THAT(world_.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional("new.example.org"s));
  EXPECT_THAT(world_.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), Optional(ElementsAre("192.0.2.9")));
  EXPECT_EQ(kAllKeys, world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataTest, SettersOfTheNodeReportThatNothingWasStored) {
  world_.host().install();
  DNSSettingData onNoNode;
  EXPECT_FALSE(onNoNode.setRequestedHostname("newhost"));
  EXPECT_FALSE(onNoNode.setDomainName("new.example.org"));
  EXPECT_FALSE(onNoNode.setDNSServerAddresses({"192.0.2.9"}));
}

TEST_F(DNSSettingDataTest, SetConfigurationNameReplacesTheKey) {
  world_.file("eth0", "CONFIG_NAME=office\nX=1\n");
  EXPECT_TRUE(atUsualNic().setConfigurationName("home"));
  EXPECT_EQ("CONFIG_NAME=home\nX=1\n", world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataTest, SetConfigurationNameAddsTheKey) {
  world_.file("eth0", "X=1\n");
  EXPECT_TRUE(atUsualNic().setConfigurationName("home"));
  EXPECT_EQ("X=1\nCONFIG_NAME=home\n", world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataTest, SetConfigurationNameSaysTrueAlsoWithoutAFile) {
  EXPECT_TRUE(atUsualNic().setConfigurationName("home"));
  EXPECT_EQ(std::nullopt, world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataTest, SetConfigurationNameLogsTheFileBeforeItWrites) {
  world_.file("eth0", "CONFIG_NAME=office\n");
  DNSSettingData data = atUsualNic();
  const FileAtEachLine file(world_, "eth0");
  data.setConfigurationName("home");
  EXPECT_THAT(file.contents, ElementsAre("CONFIG_NAME=office\n"s));
}

TEST_F(DNSSettingDataTest, SetConfigurationNameLogsTheFile) {
  DNSSettingData data = atUsualNic();
  const RecordingLogger logger;
  data.setConfigurationName("home");
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(), ElementsAre(logged("fileName", world_.filePath("eth0"))));
  EXPECT_EQ("setConfigurationName", lines.at(0).function);
}

}  // namespace
}  // namespace ZV::Test
