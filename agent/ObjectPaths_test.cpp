#include "agent/interface/ObjectPaths.h"

#include <gtest/gtest.h>

#include "tests/support/RecordingBroker.h"

namespace {

using namespace ZV::Test;

class ObjectPaths : public ::testing::Test {
 protected:
  bool equal(const Path& left, const Path& right, bool comparesReferences = true) {
    return ZV::isObjPathsEqual(broker_.make(left), broker_.make(right), comparesReferences);
  }

  RecordingBroker broker_;
  const Path path_ = Path("ZORVA_Thing").key("Name", "eth0").key("SystemName", "host1");
};

TEST_F(ObjectPaths, APathEqualsItself) {
  EXPECT_TRUE(equal(path_, path_));
  EXPECT_TRUE(equal(Path("ZORVA_Thing"), Path("ZORVA_Thing")));
}

TEST_F(ObjectPaths, ClassNamespaceAndKeyNamesMatchWithoutRegardToCase) {
  EXPECT_TRUE(equal(path_, Path("zorva_THING", "ROOT/Cimv2").key("NAME", "eth0").key("systemname", "host1")));
}

TEST_F(ObjectPaths, TheOrderOfKeysAndTheHostDoNotMatter) {
  EXPECT_TRUE(equal(path_, Path("ZORVA_Thing").key("SystemName", "host1").key("Name", "eth0").on("elsewhere")));
}

TEST_F(ObjectPaths, AnotherClassNamespaceOrSetOfKeysIsAnotherObject) {
  EXPECT_FALSE(equal(path_, Path("ZORVA_Other").key("Name", "eth0").key("SystemName", "host1")));
  EXPECT_FALSE(equal(path_, path_.in("root/other")));
  EXPECT_FALSE(equal(path_, path_.key("More", "x")));
  EXPECT_FALSE(equal(path_.key("More", "x"), path_));
  EXPECT_FALSE(equal(path_, Path("ZORVA_Thing").key("Name", "eth0").key("Other", "host1")));
}

TEST_F(ObjectPaths, KeyValuesMatchExactly) {
  EXPECT_FALSE(equal(path_, path_.key("Name", "ETH0")));
  EXPECT_FALSE(equal(path_, path_.key("Name", "eth0 ")));
}

TEST_F(ObjectPaths, ATextIsATextWhicheverTypeCarriesIt) {
  EXPECT_TRUE(equal(path_.key("Name", text("eth0")), path_.key("Name", chars("eth0"))));
  EXPECT_FALSE(equal(path_.key("Name", text("eth0")), path_.key("Name", chars("eth1"))));
}

TEST_F(ObjectPaths, NumbersMatchByTypeAndValue) {
  EXPECT_TRUE(equal(path_.key("N", uint16(7)), path_.key("N", uint16(7))));
  EXPECT_FALSE(equal(path_.key("N", uint16(7)), path_.key("N", uint16(8))));
  EXPECT_FALSE(equal(path_.key("N", uint16(7)), path_.key("N", uint32(7))));
  EXPECT_FALSE(equal(path_.key("N", uint16(7)), path_.key("N", "7")));
  EXPECT_TRUE(equal(path_.key("N", sint32(-7)), path_.key("N", sint32(-7))));
  EXPECT_TRUE(equal(path_.key("N", uint64(~0ULL)), path_.key("N", uint64(~0ULL))));
  EXPECT_TRUE(equal(path_.key("N", uint8(1)), path_.key("N", uint8(1))));
  EXPECT_TRUE(equal(path_.key("N", boolean(true)), path_.key("N", boolean(true))));
  EXPECT_FALSE(equal(path_.key("N", boolean(true)), path_.key("N", boolean(false))));
}

TEST_F(ObjectPaths, AKeyWithoutValueEqualsOnlyAnotherWithout) {
  EXPECT_TRUE(equal(path_.key("N", null(CMPI_string)), path_.key("N", null(CMPI_string))));
  EXPECT_FALSE(equal(path_.key("N", null(CMPI_string)), path_.key("N", "")));
}

TEST_F(ObjectPaths, AStateBesideAGoodValueDoesNotCount) {
  const Path link = Path("ZORVA_Link").key("A", ref(path_)).key("N", uint16(7)).key("T", "x").key("C", chars("y"));
  const CMPIObjectPath* left = broker_.make(link);
  for (const auto state :
       std::initializer_list<CMPIValueState>{CMPI_nullValue, CMPI_keyValue, CMPI_badValue, CMPI_notFound}) {
    RecordingBroker lying;
    lying.addToAllStates(state);
    EXPECT_TRUE(ZV::isObjPathsEqual(left, lying.make(link), true)) << state;
    EXPECT_TRUE(ZV::isObjPathsEqual(lying.make(link), lying.make(link), true)) << state;
    EXPECT_FALSE(ZV::isObjPathsEqual(lying.make(link), lying.make(link.key("T", "y")), true)) << state;
    EXPECT_FALSE(ZV::isObjPathsEqual(lying.make(link), lying.make(link.key("T", null(CMPI_string))), true)) << state;
    EXPECT_FALSE(ZV::isObjPathsEqual(lying.make(link), lying.make(link.key("A", ref(path_.key("Name", "eth1")))), true))
        << state;
  }
}

TEST_F(ObjectPaths, ReferencesAreComparedAsPathsOnlyWhereThatIsAskedFor) {
  const Path association = Path("ZORVA_Link").key("Antecedent", ref(path_));
  EXPECT_TRUE(equal(association, Path("ZORVA_Link").key("Antecedent", ref(path_)), true));
  EXPECT_FALSE(equal(association, association, false)) << "a reference then equals no value";
  EXPECT_FALSE(equal(association, Path("ZORVA_Link").key("Antecedent", ref(path_.key("Name", "eth1"))), true));
  EXPECT_FALSE(equal(association, Path("ZORVA_Link").key("Antecedent", "text"), true));
  EXPECT_FALSE(equal(association, Path("ZORVA_Link").key("Antecedent", null(CMPI_ref)), true));
}

TEST_F(ObjectPaths, AReferenceWithoutNamespaceHasThatOfTheEnclosingPath) {
  const Path there = Path("ZORVA_Link").key("Antecedent", ref(path_));
  EXPECT_TRUE(equal(there, Path("ZORVA_Link").key("Antecedent", ref(path_.in("")))));
  EXPECT_FALSE(equal(there, Path("ZORVA_Link", "root/other").key("Antecedent", ref(path_.in("")))));
  EXPECT_TRUE(equal(Path("ZORVA_Link").key("A", ref(path_.in(""))), Path("ZORVA_Link").key("A", ref(path_.in("")))));
}

TEST_F(ObjectPaths, ReferencesInReferencesAreComparedToo) {
  const auto nested = [this](const char* name) {
    return Path("ZORVA_Outer").key("L", ref(Path("ZORVA_Link", "").key("A", ref(path_.in("").key("Name", name)))));
  };
  EXPECT_TRUE(equal(nested("eth0"), nested("eth0")));
  EXPECT_FALSE(equal(nested("eth0"), nested("eth1")));
}

TEST_F(ObjectPaths, APathWithoutEndOfReferencesEqualsNothing) {
  Path deep = path_;
  for (int i = 0; i < 100; ++i) deep = Path("ZORVA_Link").key("A", ref(deep));
  EXPECT_FALSE(equal(deep, deep));
}

TEST_F(ObjectPaths, ANullPathAndOneWithoutHandleEqualNothing) {
  const CMPIObjectPath* path = broker_.make(path_);
  CMPIObjectPath empty{nullptr, path->ft};
  EXPECT_FALSE(ZV::isObjPathsEqual(nullptr, nullptr, true));
  EXPECT_FALSE(ZV::isObjPathsEqual(path, nullptr, true));
  EXPECT_FALSE(ZV::isObjPathsEqual(&empty, &empty, true));
}

TEST_F(ObjectPaths, WhatCannotBeReadEqualsNothing) {
  const CMPIObjectPath* left = broker_.make(path_);
  const CMPIObjectPath* right = broker_.make(path_);
  broker_.startOver();
  ASSERT_TRUE(ZV::isObjPathsEqual(left, right, true));
  const std::size_t calls = broker_.callCount();
  ASSERT_GT(calls, 0U);
  for (std::size_t n = 1; n <= calls; ++n) {
    for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
      broker_.failAt(n, mode);
      const bool result = ZV::isObjPathsEqual(left, right, true);
      EXPECT_FALSE(result && broker_.calls().at(n - 1).name != "getCharPtr") << n << ' ' << nameOf(mode);
      broker_.startOver();
    }
  }
}

}  // namespace
