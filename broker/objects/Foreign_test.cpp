// Objects of another broker in the process: our broker reads them through their own tables.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "broker/Broker.h"
#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/ObjectText.h"
#include "broker/objects/Scope.h"
#include "broker/requests/Request.h"
#include "broker/requests/Result.h"
#include "broker/testing/TestClasses.h"
#include "tests/support/RecordingBroker.h"

namespace zorva::broker {
namespace {

using ZV::Test::Instance;
using ZV::Test::Path;

class ForeignTest : public ::testing::Test {
 protected:
  CMPIObjectPath* thing(const char* name) { return foreign_.make(Path("t_thing").on("far").key("NAME", name)); }
  std::string shown(const void* object) { return objectText(object); }

  Broker broker_{testing::testClasses(), {.registry = ProviderRegistry()}};
  const CMPIBroker* cmpi_ = broker_.handle();
  BrokerCore& core_ = *BrokerCore::of(cmpi_);
  Scope scope_{core_.classes(), core_.blocks()};
  ZV::Test::RecordingBroker foreign_;
  CMPIStatus status_{CMPI_RC_OK, nullptr};
};

TEST_F(ForeignTest, APathBecomesOneOfOurs) {
  CMPIInstance* link =
      cmpi_->eft->newInstance(cmpi_, cmpi_->eft->newObjectPath(cmpi_, "root/cimv2", "T_ThingOther", nullptr), nullptr);
  CMPIValue value;
  value.ref = thing("a");
  EXPECT_EQ(link->ft->setProperty(link, "Left", &value, CMPI_ref).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(link->ft->getProperty(link, "Left", nullptr).value.ref), "//far/root/cimv2:T_Thing.Name=\"a\"");
}

TEST_F(ForeignTest, AnInstanceIsMadeFromAForeignPath) {
  CMPIInstance* made = cmpi_->eft->newInstance(cmpi_, thing("a"), &status_);
  ASSERT_NE(made, nullptr);
  EXPECT_EQ(shown(made), "instance of T_Thing {\n  Name = \"a\";\n}");
}

TEST_F(ForeignTest, ValuesOfEveryKindBecomeOurs) {
  CMPIInstance* made = cmpi_->eft->newInstance(cmpi_, thing("a"), &status_);
  CMPIValue value;
  value.string = foreign_.makeString("foreign text");
  EXPECT_EQ(made->ft->setProperty(made, "Name", &value, CMPI_string).rc, CMPI_RC_OK);
  value.array = foreign_.makeArray(ZV::Test::texts({"x", "y"}));
  EXPECT_EQ(made->ft->setProperty(made, "Labels", &value, CMPI_stringA).rc, CMPI_RC_OK);
  value.array = foreign_.makeArray(ZV::Test::uint16s({1, 2}));
  EXPECT_EQ(made->ft->setProperty(made, "Numbers", &value, CMPI_uint16A).rc, CMPI_RC_OK);
  EXPECT_EQ(made->ft->setProperty(made, "Labels", &value, CMPI_stringA).rc, CMPI_RC_ERR_TYPE_MISMATCH);
  const CMPIBroker* other = foreign_.cmpi();
  value.dateTime = other->eft->newDateTimeFromChars(other, "20240101120000.000000+000", nullptr);
  EXPECT_EQ(made->ft->setProperty(made, "Since", &value, CMPI_dateTime).rc, CMPI_RC_OK);
  foreign_.setKeysOfClass("T_Thing", {"Name"});
  value.inst = foreign_.make(Instance("T_Thing").with("Name", "inner").with("Size", ZV::Test::uint16(4)));
  EXPECT_EQ(made->ft->setProperty(made, "Inner", &value, CMPI_instance).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(made),
            "instance of T_Thing {\n  Name = \"foreign text\";\n  Labels = {\"x\", \"y\"};\n  Numbers = {1, 2};\n"
            "  Since = \"20240101120000.000000+000\";\n"
            "  Inner = instance of T_Thing {\n  Name = \"inner\";\n  Size = 4;\n};\n}");
}

TEST_F(ForeignTest, AnObjectWithoutInsidesIsRefused) {
  CMPIInstance* made = cmpi_->eft->newInstance(cmpi_, thing("a"), &status_);
  CMPIString hollow = *foreign_.makeString("x");
  hollow.hdl = nullptr;
  CMPIValue value;
  value.string = &hollow;
  EXPECT_EQ(made->ft->setProperty(made, "Name", &value, CMPI_string).rc, CMPI_RC_ERR_INVALID_HANDLE);
  CMPIObjectPath noTable{&hollow, nullptr};
  EXPECT_EQ(cmpi_->eft->newInstance(cmpi_, &noTable, &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

class LastReceiver : public Receiver {
 public:
  bool takeInstance(const InstanceObject& instance) override {
    last = objectText(static_cast<const void*>(static_cast<const CMPIInstance*>(&instance)));
    return true;
  }
  bool takePath(const PathObject& path) override {
    last = objectText(path);
    return true;
  }
  std::string last;
};

TEST_F(ForeignTest, ResultsMayBeForeign) {
  LastReceiver receiver;
  ResultObject result(core_, ResultObject::Instances | ResultObject::Paths, &receiver, "test");
  EXPECT_EQ(result.ft->returnObjectPath(&result, thing("a")).rc, CMPI_RC_OK);
  EXPECT_EQ(receiver.last, "//far/root/cimv2:T_Thing.Name=\"a\"");
  foreign_.setKeysOfClass("T_Thing", {"Name"});
  CMPIInstance* instance = foreign_.make(Instance("T_Thing").with("name", "b").with("NoSuch", "lost"));
  EXPECT_EQ(result.ft->returnInstance(&result, instance).rc, CMPI_RC_OK);
  EXPECT_EQ(receiver.last, "instance of T_Thing {\n  Name = \"b\";\n}");
}

TEST_F(ForeignTest, ForeignHandlesAreNotOursToWorkOn) {
  CMPIObjectPath* path = thing("a");
  EXPECT_EQ(PathObject::table.getKeyCount(path, &status_), 0U);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(textOf(cmpi_->eft->toString(cmpi_, path, &status_)), "");
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_HANDLE);
  cmpi_->mft->freeObjectPath(cmpi_, path);  // calls the path's own release
  EXPECT_EQ(foreign_.calls().count("release"), 1U);
}

TEST_F(ForeignTest, ANamespaceIsTakenOverFromAForeignPath) {
  CMPIObjectPath* mine = cmpi_->eft->newObjectPath(cmpi_, "", "T_Thing", nullptr);
  EXPECT_EQ(mine->ft->setHostAndNameSpaceFromObjectPath(mine, thing("a")).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(mine), "//far/root/cimv2:T_Thing");
}

TEST_F(ForeignTest, AForeignBrokerIsNoneOfOurs) {
  EXPECT_EQ(cmpi_->eft->newString(foreign_.cmpi(), "x", &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace
}  // namespace zorva::broker
