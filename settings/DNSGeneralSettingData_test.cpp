#include "settings/DNSGeneralSettingData.h"

#include "settings/testing/FileAtEachLine.h"
#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kBothKeys = "CONFIG_NAME=office\nDNSSUFFIXES=lab.example.org file.example.org \n";

class DNSGeneralSettingDataTest : public ::testing::Test {
 protected:
  // The cursor on the node whose settings are the host's.
  DNSGeneralSettingData found() {
    world_.install();
    DNSGeneralSettingData data;
    EXPECT_TRUE(static_cast<bool>(data));
    return data;
  }
  DNSGeneralSettingData atUsualNic() {
    world_.nic("eth0", usualNic());
    return found();
  }
  std::vector<std::string> suffixes(DNSGeneralSettingData data) {
    std::vector<std::string> values;
    EXPECT_TRUE(data.getDNSSuffixesToAppend(values));
    return values;
  }

  World world_;
};

using Text = bool (DNSGeneralSettingData::*)(std::string&);

// The result of a getter, with its output: "before" if it was not changed.
std::pair<bool, std::string> get(DNSGeneralSettingData data, Text getter) {
  std::string value = "before";
  const bool given = (data.*getter)(value);
  return {given, value};
}
const std::pair<bool, std::string> kUntouched = {false, "before"};

std::string variable(const std::string& name, const std::string& value) {
  return "Zorvagent.DNSSettingDataProvider 4000 VARIABLE " + name + " = " + value;
}
const std::string kNoName =
    "Zorvagent.DNSSettingDataProvider 6000 MESSAGE Name Property is not available from Instrumentation";

// --- finding the node

TEST_F(DNSGeneralSettingDataTest, IsOnNoNodeIfThereIsNoInterface) {
  world_.host().install();
  DNSGeneralSettingData data;
  EXPECT_FALSE(static_cast<bool>(data));
}

TEST_F(DNSGeneralSettingDataTest, IsOnNoNodeIfAllInterfacesAreTheServiceProcessors) {
  world_.bmc().nic("bmc0").nic("bmc1").install();
  DNSGeneralSettingData data;
  EXPECT_FALSE(static_cast<bool>(data));
  EXPECT_FALSE(static_cast<bool>(data));
}

TEST_F(DNSGeneralSettingDataTest, SkipsTheServiceProcessorsInterfaces) {
  world_.bmc().nic("bmc0", usualNic()).host().nic("eth0");
  world_.file("bmc0", "CONFIG_NAME=wrong\n").file("eth0", kBothKeys);
  DNSGeneralSettingData data = found();
  EXPECT_EQ(std::pair(true, "eth0"s), get(data, &DNSGeneralSettingData::getInstanceID));
  EXPECT_EQ(std::pair(true, "office"s), get(data, &DNSGeneralSettingData::getConfigurationName));
}

TEST_F(DNSGeneralSettingDataTest, SkipsOnADescriptionOfExactlyBMC) {
  for (const std::string description : {"bmc", "BMC ", "", "Computer"}) {
    World world;
    world.system("first", description).nic("eth0").system("second", "Computer").nic("eth1").install();
    DNSGeneralSettingData data;
    EXPECT_TRUE(static_cast<bool>(data));
    EXPECT_EQ("eth0", get(data, &DNSGeneralSettingData::getInstanceID).second) << description;
  }
}

TEST_F(DNSGeneralSettingDataTest, AskingAgainStaysOnTheNode) {
  world_.bmc().nic("bmc0").host().nic("eth0").nic("eth1");
  DNSGeneralSettingData data = found();
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_EQ("eth0", get(data, &DNSGeneralSettingData::getInstanceID).second);
}

TEST_F(DNSGeneralSettingDataTest, GoesOnToTheNextNodeOnItsOwn) {
  world_.host().nic("eth0").bmc().nic("bmc0").system("other", "Computer").nic("eth1");
  DNSGeneralSettingData data = found();
  ++data;
  EXPECT_TRUE(static_cast<bool>(data));
  EXPECT_EQ("eth1", get(data, &DNSGeneralSettingData::getInstanceID).second);
  ++data;
  EXPECT_FALSE(static_cast<bool>(data));
}

TEST_F(DNSGeneralSettingDataTest, ACopyIsOnTheSameNode) {
  world_.nic("eth0").nic("eth1");
  DNSGeneralSettingData data = found();
  DNSGeneralSettingData copy = data;
  ++data;
  EXPECT_EQ("eth0", get(copy, &DNSGeneralSettingData::getInstanceID).second);
  EXPECT_EQ("eth1", get(data, &DNSGeneralSettingData::getInstanceID).second);
}

TEST_F(DNSGeneralSettingDataTest, LogsTheSystemOfEachNodeThatItTests) {
  world_.bmc().nic("bmc0").host().nic("eth0").install();
  const RecordingLogger logger;
  DNSGeneralSettingData data;
  EXPECT_EQ(0U, logger.size());
  EXPECT_TRUE(static_cast<bool>(data));
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(),
              ElementsAre(variable("nodeString", "BMC"), variable("nodeString", "Computer")));
  EXPECT_EQ("operator bool", lines.at(0).function);
  EXPECT_EQ("settings/DNSGeneralSettingData.cpp", lines.at(0).file);
}

TEST_F(DNSGeneralSettingDataTest, ATreeThatCannotBeReadIsLoggedAndLeavesNoNode) {
  world_.installUnreadable();
  const RecordingLogger logger;
  DNSGeneralSettingData data;
  EXPECT_FALSE(static_cast<bool>(data));
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(),
              ElementsAre("Zorvagent.DNSSettingDataProvider 6000 MESSAGE Select Node for NetworkIPConfig failed"));
  EXPECT_EQ("DNSGeneralSettingData", lines.at(0).function);
}

TEST_F(DNSGeneralSettingDataTest, WhateverSelectingThrowsIsCaughtAndAllElseFliesOn) {
  world_.nic("eth0", usualNic()).install();
  std::size_t flown = 0;
  std::size_t toldInLog = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    const RecordingLogger logger;
    try {
      DNSGeneralSettingData data;
      if (data) suffixes(data);
    } catch (...) {
      ++flown;
    }
    toldInLog += logger.pairs().errors().size();
  });
  EXPECT_EQ(2U, toldInLog);  // selectNode by type, failing in both ways
  EXPECT_EQ(tried - 2, flown);
  EXPECT_GT(tried, 14U);
}

// --- values

TEST_F(DNSGeneralSettingDataTest, ItsInstanceIDIsTheNameOfTheInterface) {
  EXPECT_EQ(std::pair(true, "eth0"s), get(atUsualNic(), &DNSGeneralSettingData::getInstanceID));
}

TEST_F(DNSGeneralSettingDataTest, ANodeWithoutANameHasNoInstanceIDAndThatIsLogged) {
  world_.nic("x", {.isUnnamed = true});
  DNSGeneralSettingData data = found();
  const RecordingLogger logger;
  EXPECT_EQ(kUntouched, get(data, &DNSGeneralSettingData::getInstanceID));
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(), ElementsAre(kNoName));
  EXPECT_EQ("getInstanceID", lines.at(0).function);
}

TEST_F(DNSGeneralSettingDataTest, ElementNameCaptionDescriptionAndOriginAreConstants) {
  DNSGeneralSettingData data = atUsualNic();
  EXPECT_EQ(std::pair(true, "DNSGeneralSettingData"s), get(data, &DNSGeneralSettingData::getElementName));
  EXPECT_EQ(std::pair(true, "DNS General Configuration"s), get(data, &DNSGeneralSettingData::getCaption));
  EXPECT_EQ(std::pair(true, "Represents DNS General Configuration for DNS Protocol EndPoint"s),
            get(data, &DNSGeneralSettingData::getDescription));
  unsigned short origin = 77;
  EXPECT_TRUE(data.getAddressOrigin(origin));
  EXPECT_EQ(2, origin);
}

TEST_F(DNSGeneralSettingDataTest, WhetherToAppendSuffixesIsNeverReturnedAndLeavesTheOutputUnchanged) {
  DNSGeneralSettingData data = atUsualNic();
  for (const bool before : {false, true}) {
    bool value = before;
    EXPECT_FALSE(data.getAppendPrimarySuffixes(value));
    EXPECT_FALSE(data.getAppendParentSuffixes(value));
    EXPECT_EQ(before, value);
  }
}

// --- file or node

TEST_F(DNSGeneralSettingDataTest, TheConfigurationNameIsThatOfTheFileAndLogged) {
  world_.file("eth0", kBothKeys);
  DNSGeneralSettingData data = atUsualNic();
  const RecordingLogger logger;
  EXPECT_EQ(std::pair(true, "office"s), get(data, &DNSGeneralSettingData::getConfigurationName));
  EXPECT_THAT(logger.pairs().briefsWithCategory(), ElementsAre(variable("configurationName", "office")));
}

TEST_F(DNSGeneralSettingDataTest, AFileWithoutTheKeyGivesAnEmptyConfigurationName) {
  world_.file("eth0", "");
  EXPECT_EQ(std::pair(true, ""s), get(atUsualNic(), &DNSGeneralSettingData::getConfigurationName));
}

TEST_F(DNSGeneralSettingDataTest, WithoutAFileThereIsNoConfigurationName) {
  EXPECT_EQ(kUntouched, get(atUsualNic(), &DNSGeneralSettingData::getConfigurationName));
}

TEST_F(DNSGeneralSettingDataTest, TheSuffixesAreThoseOfTheFile) {
  world_.file("eth0", kBothKeys);
  EXPECT_THAT(suffixes(atUsualNic()), ElementsAre("lab.example.org", "file.example.org"));
}

TEST_F(DNSGeneralSettingDataTest, AFileWithoutTheKeyGivesNoSuffixes) {
  world_.file("eth0", "CONFIG_NAME=office\n");
  EXPECT_THAT(suffixes(atUsualNic()), ElementsAre());
}

TEST_F(DNSGeneralSettingDataTest, WithoutAFileTheSuffixesAreThoseOfTheNode) {
  EXPECT_THAT(suffixes(atUsualNic()), ElementsAre("example.org"));
}

TEST_F(DNSGeneralSettingDataTest, SuffixesAreReturnedEvenIfThereAreNone) {
  world_.nic("eth0");
  std::vector<std::string> values = {"before"};
  EXPECT_TRUE(found().getDNSSuffixesToAppend(values));
  EXPECT_THAT(values, ElementsAre());
}

TEST_F(DNSGeneralSettingDataTest, ANodeWithoutANameHasAFileWhoseNameEndsInTheHyphen) {
  world_.nic("x", {.suffixes = {"node.example.org"}, .isUnnamed = true});
  DNSGeneralSettingData data = found();
  const RecordingLogger logger;
  EXPECT_EQ(world_.dataDir() + "ifcfg-", data.getFileName());
  EXPECT_THAT(suffixes(data), ElementsAre("node.example.org"));
  EXPECT_EQ(kUntouched, get(data, &DNSGeneralSettingData::getConfigurationName));
  EXPECT_THAT(logger.pairs().briefsWithCategory(), ElementsAre(kNoName, kNoName, kNoName));
  world_.file("", kBothKeys);
  EXPECT_THAT(suffixes(data), ElementsAre("lab.example.org", "file.example.org"));
  EXPECT_EQ(std::pair(true, "office"s), get(data, &DNSGeneralSettingData::getConfigurationName));
}

// --- setters

TEST_F(DNSGeneralSettingDataTest, SetConfigurationNameLogsTheFileAndReplacesTheKey) {
  world_.file("eth0", "CONFIG_NAME=office\nX=1\n");
  DNSGeneralSettingData data = atUsualNic();
  const RecordingLogger logger;
  EXPECT_TRUE(data.setConfigurationName("home"));
  EXPECT_EQ("CONFIG_NAME=home\nX=1\n", world_.fileContent("eth0"));
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(), ElementsAre(variable("l_strFileName", world_.filePath("eth0"))));
  EXPECT_EQ("setConfigurationName", lines.at(0).function);
}

TEST_F(DNSGeneralSettingDataTest, SetConfigurationNameLogsTheFileBeforeItWrites) {
  world_.file("eth0", "CONFIG_NAME=office\n");
  DNSGeneralSettingData data = atUsualNic();
  const FileAtEachLine file(world_, "eth0");
  data.setConfigurationName("home");
  EXPECT_THAT(file.contents, ElementsAre("CONFIG_NAME=office\n"s));
}

TEST_F(DNSGeneralSettingDataTest, SetConfigurationNameAddsTheKey) {
  world_.file("eth0", "X=1\n");
  EXPECT_TRUE(atUsualNic().setConfigurationName("home"));
  EXPECT_EQ("X=1\nCONFIG_NAME=home\n", world_.fileContent("eth0"));
}

TEST_F(DNSGeneralSettingDataTest, SetConfigurationNameSaysTrueAlsoWithoutAFile) {
  EXPECT_TRUE(atUsualNic().setConfigurationName("home"));
  EXPECT_EQ(std::nullopt, world_.fileContent("eth0"));
}

TEST_F(DNSGeneralSettingDataTest, SetDNSSuffixesToAppendStoresInTheNodeBetweenItsTwoLines) {
  world_.file("eth0", kBothKeys);
  DNSGeneralSettingData data = atUsualNic();
  const RecordingLogger logger;
  EXPECT_TRUE(data.setDNSSuffixesToAppend({"new.example.org", "b"}));
  EXPECT_THAT(world_.list(0, NodeLexicon::PROP_DNS_SUFFIXES), Optional(ElementsAre("new.example.org", "b")));
  EXPECT_EQ(kBothKeys, world_.fileContent("eth0"));
  EXPECT_THAT(logger.pairs().briefsWithCategory(),
              ElementsAre("Zorvagent.DNSSettingDataProvider 3000 ENTERING setDNSSuffixesToAppend, dnsSuffixes=ADDR",
                          "Zorvagent.DNSSettingDataProvider 3000 EXITING setDNSSuffixesToAppend, dnsSuffixes=ADDR"));
}

TEST_F(DNSGeneralSettingDataTest, SetDNSSuffixesToAppendReportsThatNothingWasStored) {
  world_.host().install();
  EXPECT_FALSE(DNSGeneralSettingData().setDNSSuffixesToAppend({"new.example.org"}));
}

}  // namespace
}  // namespace ZV::Test
