#include "factory/InstanceModification.h"

#include "tests/support/Matchers.h"
#include "tests/support/ProviderCall.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

using Modify = unsigned int (*)(const CMPIBroker*, const CMPIObjectPath*, const char**, const CMPIInstance*,
                                CMPIStatus*);
struct Modification {
  const char* name;
  Modify modify;
  const char* className;
  const char* keyName;
  const char* keyValue;
};
const Modification kModifications[] = {
    {"modifyDNSSettingDataCMPIInstance", modifyDNSSettingDataCMPIInstance, "ZORVA_DNSSettingData", "InstanceID",
     "Computer%eth0"},
    {"modifyDNSGeneralSettingDataCMPIInstance", modifyDNSGeneralSettingDataCMPIInstance, "ZORVA_DNSGeneralSettingData",
     "InstanceID", "dnsgen1:host1"},
    {"modifyDNSProtocolEndpointCMPIInstance", modifyDNSProtocolEndpointCMPIInstance, "ZORVA_DNSProtocolEndPoint",
     "Name", "eth0"},
};

class EachModification : public ::testing::TestWithParam<Modification> {
 protected:
  EachModification() { world_.nic("eth0", usualNic()).install().file("eth0", "CONFIG_NAME=office\n"); }

  unsigned int modify(const CMPIInstance* instance) {
    const CMPIObjectPath* ref =
        broker_.make(Path(GetParam().className).key(GetParam().keyName, GetParam().keyValue), "ref");
    return GetParam().modify(broker_.cmpi(), ref, nullptr, instance, &status_);
  }
  unsigned int modify(const Instance& instance) { return modify(broker_.make(instance)); }
  LogLines lines() const { return logger_.pairs().ofCategory("Zorvagent.DNSObjFactory"); }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  CMPIStatus status_ = {CMPI_RC_OK, nullptr};
};

TEST_P(EachModification, RefusesAnInstanceThatIsMissingOrHasNoHandle) {
  CMPIInstance* withoutHandle = broker_.make(Instance(GetParam().className).with("ConfigurationName", "home"));
  withoutHandle->hdl = nullptr;
  for (const CMPIInstance* instance : std::vector<const CMPIInstance*>{nullptr, withoutHandle}) {
    logger_.clear();
    EXPECT_EQ(CMPI_RC_ERR_FAILED, static_cast<CMPIrc>(modify(instance)));
    EXPECT_THAT(lines(), SizeIs(2));
    EXPECT_THAT(lines().errors(), ElementsAre("Instance to be Modified is NULL"));
    EXPECT_EQ(GetParam().name, lines().back().function);
    EXPECT_EQ("factory/InstanceModification.cpp", lines().back().file);
    EXPECT_EQ(CMPI_RC_OK, status_.rc);
    EXPECT_THAT(broker_.calls(), IsEmpty());
  }
  EXPECT_EQ("CONFIG_NAME=office\n", world_.fileContent("eth0"));
}

TEST_P(EachModification, NeedsNoBroker) {
  const CMPIObjectPath* ref = broker_.make(Path(GetParam().className).key(GetParam().keyName, GetParam().keyValue));
  const CMPIInstance* instance = broker_.make(Instance(GetParam().className).with("ConfigurationName", "home"));
  EXPECT_EQ(0U, GetParam().modify(nullptr, ref, nullptr, instance, &status_));
}

INSTANTIATE_TEST_SUITE_P(InstanceModification, EachModification, ::testing::ValuesIn(kModifications),
                         [](const auto& modification) { return modification.param.name; });

class InstanceModification : public ::testing::Test {
 protected:
  InstanceModification() { world_.nic("eth0", usualNic()).install(); }

  unsigned int modify(Modify function, const Path& path, const Instance& instance) {
    return function(broker_.cmpi(), broker_.make(path), nullptr, broker_.make(instance), &status_);
  }
  unsigned int modifySetting(const Instance& instance) {
    return modify(modifyDNSSettingDataCMPIInstance, Path("ZORVA_DNSSettingData").key("InstanceID", "Computer%eth0"),
                  instance);
  }
  unsigned int modifyGeneral(const Instance& instance) {
    return modify(modifyDNSGeneralSettingDataCMPIInstance, Path("ZORVA_DNSGeneralSettingData"), instance);
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  CMPIStatus status_ = {CMPI_RC_OK, nullptr};
  const Instance setting_{"ZORVA_DNSSettingData"};
  const Instance general_{"ZORVA_DNSGeneralSettingData"};
};

TEST_F(InstanceModification, OfTheSettingDataSaysWhatWasRefusedByItsNumberAndLeavesTheStatus) {
  EXPECT_EQ(4U, modifySetting(setting_.with("RequestedHostname", "a b")));
  EXPECT_EQ(4U, modifySetting(setting_.with("DomainName", "a b")));
  EXPECT_EQ(CMPI_RC_OK, status_.rc);
  EXPECT_THAT(logger_.pairs().errors(), IsEmpty());
}

TEST_F(InstanceModification, OfTheSettingDataIsDoneIfTheBrokerFailsToReturnTheConfigurationsName) {
  world_.file("eth0", "CONFIG_NAME=office\n");
  EXPECT_EQ(0U, modifySetting(setting_.with("ConfigurationName", "home")));
  const Calls calls = broker_.calls();
  std::size_t last = 0;
  for (std::size_t i = 0; i < calls.size(); ++i) {
    if (calls[i].name == "getCharPtr") last = i + 1;
  }
  broker_.startOver();
  broker_.failAt(last, Mode::RcAndNull);
  EXPECT_EQ(0U, modifySetting(setting_.with("ConfigurationName", "other")));
  EXPECT_TRUE(broker_.hasFailed());
  EXPECT_EQ("CONFIG_NAME=home\n", world_.fileContent("eth0").value_or("no file")) << "the key is as it was";
}

TEST_F(InstanceModification, OfTheGeneralDataFailsIfNeitherPropertyIsThere) {
  EXPECT_EQ(1U, modifyGeneral(general_));
  EXPECT_EQ(1U, modifyGeneral(general_.with("DNSSuffixesToAppend", "no array")));
  EXPECT_EQ(0U, modifyGeneral(general_.with("DNSSuffixesToAppend", texts({"a"}))));
  EXPECT_EQ(0U, modifyGeneral(general_.with("ConfigurationName", "home")));
}

TEST_F(InstanceModification, OfTheEndpointIsDoneEvenIfNoNodeHasTheName) {
  const Path nobody = Path("ZORVA_DNSProtocolEndPoint").key("Name", "eth9");
  EXPECT_EQ(0U, modify(modifyDNSProtocolEndpointCMPIInstance, nobody, Instance("ZORVA_DNSProtocolEndPoint")));
  EXPECT_FALSE(logger_.pairs().exited("modifyDNSProtocolEndpointCMPIInstance"));
}

}  // namespace
}  // namespace ZV::Test
