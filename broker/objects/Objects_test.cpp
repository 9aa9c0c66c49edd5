// CMPI objects as a provider sees them: only through their function tables.

#include "broker/objects/Objects.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/ObjectText.h"
#include "broker/objects/Scope.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

class ObjectsTest : public ::testing::Test {
 protected:
  CMPIObjectPath* path(const char* className = "T_Thing", const char* nameSpace = "root/cimv2") {
    return cmpi_->eft->newObjectPath(cmpi_, nameSpace, className, &status_);
  }
  CMPIObjectPath* thing(const char* name) {
    CMPIObjectPath* made = path();
    addKey(made, "Name", name);
    return made;
  }
  CMPIInstance* instance(const char* className = "T_Thing") {
    return cmpi_->eft->newInstance(cmpi_, path(className), &status_);
  }
  static CMPIrc addKey(CMPIObjectPath* to, const char* name, const char* text) {
    return to->ft->addKey(to, name, reinterpret_cast<const CMPIValue*>(text), CMPI_chars).rc;
  }
  static CMPIrc set(CMPIInstance* to, const char* name, const char* text) {
    return to->ft->setProperty(to, name, reinterpret_cast<const CMPIValue*>(text), CMPI_chars).rc;
  }
  template <typename Number>
  static CMPIrc set(CMPIInstance* to, const char* name, Number number, CMPIType type) {
    return to->ft->setProperty(to, name, reinterpret_cast<const CMPIValue*>(&number), type).rc;
  }
  CMPIData get(const CMPIInstance* from, const char* name) { return from->ft->getProperty(from, name, &status_); }
  std::string shown(const void* object) { return std::string(textOf(cmpi_->eft->toString(cmpi_, object, &status_))); }
  std::vector<std::string> propertyNames(const CMPIInstance* of) {
    std::vector<std::string> names;
    for (CMPICount i = 0; i < of->ft->getPropertyCount(of, nullptr); ++i) {
      CMPIString* name = nullptr;
      of->ft->getPropertyAt(of, i, &name, nullptr);
      names.emplace_back(textOf(name));
    }
    return names;
  }

  Broker broker_{testing::testClasses(), {.registry = ProviderRegistry()}};
  const CMPIBroker* cmpi_ = broker_.handle();
  Scope scope_{BrokerCore::of(cmpi_)->classes(), BrokerCore::of(cmpi_)->blocks()};
  CMPIStatus status_{CMPI_RC_OK, nullptr};
};

TEST_F(ObjectsTest, NamesComeBackInTheSchemasSpelling) {
  CMPIObjectPath* made = path("t_THING");
  addKey(made, "NAME", "a");
  EXPECT_EQ(textOf(made->ft->getClassName(made, nullptr)), "T_Thing");
  CMPIString* name = nullptr;
  made->ft->getKeyAt(made, 0, &name, nullptr);
  EXPECT_EQ(textOf(name), "Name");
  CMPIInstance* object = instance("t_thing");
  set(object, "sInCe", nullptr);
  EXPECT_THAT(propertyNames(object), ::testing::ElementsAre("Since"));
}

TEST_F(ObjectsTest, APathOfAClassThatTheSchemaLacksKeepsItsSpelling) {
  CMPIObjectPath* made = path("Foreign_Class");
  addKey(made, "kEy", "a");
  EXPECT_EQ(shown(made), "root/cimv2:Foreign_Class.kEy=\"a\"");
  EXPECT_EQ(cmpi_->eft->newInstance(cmpi_, made, &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(textOf(status_.msg), "there is no class Foreign_Class");
}

TEST_F(ObjectsTest, KeysKeepTheOrderInWhichTheyCame) {
  CMPIObjectPath* made = path("T_Two");
  const CMPIUint32 second = 2;
  made->ft->addKey(made, "Second", reinterpret_cast<const CMPIValue*>(&second), CMPI_uint32);
  addKey(made, "First", "x");
  addKey(made, "first", "y");  // replaces
  EXPECT_EQ(made->ft->getKeyCount(made, nullptr), 2U);
  EXPECT_EQ(shown(made), "root/cimv2:T_Two.Second=2,First=\"y\"");
  EXPECT_EQ(made->ft->getKey(made, "SECOND", &status_).value.uint32, 2U);
  EXPECT_EQ(made->ft->getKey(made, "SECOND", &status_).state, CMPI_keyValue);
  EXPECT_EQ(made->ft->getKey(made, "Third", &status_).state, CMPI_notFound | CMPI_nullValue);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(addKey(made, "Second", "no number"), CMPI_RC_ERR_TYPE_MISMATCH);
}

TEST_F(ObjectsTest, WhatIsNotSetInAPathIsTheEmptyText) {
  CMPIObjectPath* made = cmpi_->eft->newObjectPath(cmpi_, nullptr, nullptr, nullptr);
  EXPECT_STREQ(made->ft->getNameSpace(made, nullptr)->ft->getCharPtr(made->ft->getNameSpace(made, nullptr), nullptr),
               "");
  EXPECT_EQ(textOf(made->ft->getHostname(made, nullptr)), "");
  EXPECT_EQ(textOf(made->ft->getClassName(made, nullptr)), "");
}

TEST_F(ObjectsTest, ATextThatWasReadStaysWhenThePathChanges) {
  CMPIObjectPath* made = path();
  CMPIString* before = made->ft->getNameSpace(made, nullptr);
  made->ft->setNameSpace(made, "root/other");
  EXPECT_EQ(textOf(before), "root/cimv2");
  EXPECT_EQ(textOf(made->ft->getNameSpace(made, nullptr)), "root/other");
}

TEST_F(ObjectsTest, NamespaceAndHostCanBeTakenOver) {
  CMPIObjectPath* from = path("T_Thing", "root/a");
  from->ft->setHostname(from, "h");
  CMPIObjectPath* to = path();
  to->ft->setNameSpaceFromObjectPath(to, from);
  EXPECT_EQ(textOf(to->ft->getNameSpace(to, nullptr)), "root/a");
  EXPECT_EQ(textOf(to->ft->getHostname(to, nullptr)), "");
  to->ft->setHostAndNameSpaceFromObjectPath(to, from);
  EXPECT_EQ(textOf(to->ft->getHostname(to, nullptr)), "h");
}

TEST_F(ObjectsTest, AnUnsetPropertyIsNullAndOneThatTheClassLacksIsMissing) {
  CMPIInstance* object = instance();
  CMPIData data = get(object, "size");
  EXPECT_EQ(status_.rc, CMPI_RC_OK);
  EXPECT_EQ(data.state, CMPI_nullValue);
  EXPECT_EQ(data.type, CMPI_uint16);
  data = get(object, "NoSuch");
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(data.state, CMPI_notFound | CMPI_nullValue);
  EXPECT_EQ(object->ft->getPropertyCount(object, nullptr), 0U);
}

TEST_F(ObjectsTest, SettingAPropertyThatTheClassLacksIsRefused) {
  CMPIInstance* object = instance();
  const CMPIStatus refused =
      object->ft->setProperty(object, "NoSuch", reinterpret_cast<const CMPIValue*>("x"), CMPI_chars);
  EXPECT_EQ(refused.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(textOf(refused.msg), "T_Thing has no property NoSuch");
  EXPECT_EQ(object->ft->setProperty(object, nullptr, nullptr, CMPI_chars).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ObjectsTest, EachTypeIsKeptAsItIsDeclared) {
  CMPIInstance* object = instance();
  EXPECT_EQ(set(object, "Good", CMPIBoolean{1}, CMPI_boolean), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Letter", CMPIChar16{65}, CMPI_char16), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Tiny", CMPIUint8{255}, CMPI_uint8), CMPI_RC_OK);
  EXPECT_EQ(set(object, "STiny", CMPISint8{-128}, CMPI_sint8), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Size", CMPIUint16{65535}, CMPI_uint16), CMPI_RC_OK);
  EXPECT_EQ(set(object, "SSmall", CMPISint16{-2}, CMPI_sint16), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Wide", CMPIUint32{4000000000U}, CMPI_uint32), CMPI_RC_OK);
  EXPECT_EQ(set(object, "SWide", CMPISint32{-3}, CMPI_sint32), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Huge", CMPIUint64{UINT64_MAX}, CMPI_uint64), CMPI_RC_OK);
  EXPECT_EQ(set(object, "SHuge", CMPISint64{INT64_MIN}, CMPI_sint64), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Rough", CMPIReal32{0.5F}, CMPI_real32), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Ratio", CMPIReal64{0.25}, CMPI_real64), CMPI_RC_OK);
  EXPECT_EQ(get(object, "Huge").value.uint64, UINT64_MAX);
  EXPECT_EQ(get(object, "SHuge").value.sint64, INT64_MIN);
  EXPECT_EQ(shown(object),
            "instance of T_Thing {\n  Good = TRUE;\n  Letter = 'A';\n  Tiny = 255;\n  STiny = -128;\n  Size = 65535;\n"
            "  SSmall = -2;\n  Wide = 4000000000;\n  SWide = -3;\n  Huge = 18446744073709551615;\n"
            "  SHuge = -9223372036854775808;\n  Rough = 0.5;\n  Ratio = 0.25;\n}");
}

TEST_F(ObjectsTest, AValueOfAnotherTypeIsRefused) {
  CMPIInstance* object = instance();
  EXPECT_EQ(set(object, "Size", CMPIUint32{1}, CMPI_uint32), CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(set(object, "Size", "1"), CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(set(object, "Labels", "x"), CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(set(object, "Size", CMPIUint32{1}, CMPI_filter), CMPI_RC_ERR_INVALID_DATA_TYPE);
  EXPECT_EQ(object->ft->getPropertyCount(object, nullptr), 0U);
}

TEST_F(ObjectsTest, AllFormsOfTextFitAText) {
  CMPIInstance* object = instance();
  char text[] = "pointed at";
  CMPIValue value;
  value.chars = text;
  EXPECT_EQ(object->ft->setProperty(object, "Name", &value, CMPI_charsptr).rc, CMPI_RC_OK);
  EXPECT_EQ(textOf(get(object, "Name").value.string), "pointed at");
  value.string = cmpi_->eft->newString(cmpi_, "an object", nullptr);
  EXPECT_EQ(object->ft->setProperty(object, "Name", &value, CMPI_string).rc, CMPI_RC_OK);
  EXPECT_EQ(get(object, "Name").type, CMPI_string);
  EXPECT_EQ(textOf(get(object, "Name").value.string), "an object");
  EXPECT_EQ(object->ft->setProperty(object, "Name", nullptr, CMPI_chars).rc, CMPI_RC_OK);
  EXPECT_EQ(get(object, "Name").state, CMPI_nullValue);
}

TEST_F(ObjectsTest, ValuesAreCopied) {
  CMPIInstance* object = instance("T_ThingOther");
  CMPIObjectPath* left = thing("before");
  CMPIValue value;
  value.ref = left;
  EXPECT_EQ(object->ft->setProperty(object, "Left", &value, CMPI_ref).rc, CMPI_RC_OK);
  addKey(left, "Name", "after");
  EXPECT_EQ(shown(get(object, "Left").value.ref), "root/cimv2:T_Thing.Name=\"before\"");

  CMPIInstance* labelled = instance();
  CMPIArray* labels = cmpi_->eft->newArray(cmpi_, 1, CMPI_string, nullptr);
  value.array = labels;
  labelled->ft->setProperty(labelled, "Labels", &value, CMPI_stringA);
  labels->ft->setElementAt(labels, 0, reinterpret_cast<const CMPIValue*>("late"), CMPI_chars);
  EXPECT_EQ(shown(get(labelled, "Labels").value.array), "{NULL}");
}

TEST_F(ObjectsTest, ACopyOfAPathIsItsOwn) {
  CMPIInstance* link = instance("T_ThingOther");
  CMPIObjectPath* left = thing("before");
  CMPIValue value;
  value.ref = left;
  link->ft->setProperty(link, "Left", &value, CMPI_ref);
  CMPIObjectPath* inside = get(link, "Left").value.ref;
  addKey(inside, "Name", "inside");
  addKey(left, "Other", "more");
  EXPECT_EQ(shown(left), "root/cimv2:T_Thing.Name=\"before\",Other=\"more\"");
  CMPIObjectPath* name = link->ft->getObjectPath(link, nullptr);
  CMPIObjectPath* farEnd = name->ft->getKey(name, "Left", nullptr).value.ref;
  addKey(farEnd, "Name", "of the name");
  EXPECT_EQ(shown(get(link, "Left").value.ref), "root/cimv2:T_Thing.Name=\"inside\"");
  EXPECT_EQ(shown(farEnd), "root/cimv2:T_Thing.Name=\"of the name\"");
}

TEST_F(ObjectsTest, AnEmbeddedInstanceFitsWhereItIsDeclared) {
  CMPIInstance* inner = instance();
  set(inner, "Name", "inner");
  CMPIInstance* outer = instance();
  CMPIValue value;
  value.inst = inner;
  EXPECT_EQ(outer->ft->setProperty(outer, "Inner", &value, CMPI_instance).rc, CMPI_RC_OK);
  EXPECT_EQ(outer->ft->setProperty(outer, "Name", &value, CMPI_instance).rc, CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(shown(outer), "instance of T_Thing {\n  Inner = instance of T_Thing {\n  Name = \"inner\";\n};\n}");
}

TEST_F(ObjectsTest, TheFilterDropsWhatIsNotListedInSilence) {
  CMPIInstance* object = instance();
  const char* list[] = {"SIZE", "NoSuch", nullptr};
  const char* keys[] = {"Name", nullptr};
  EXPECT_EQ(object->ft->setPropertyFilter(object, list, keys).rc, CMPI_RC_OK);
  EXPECT_EQ(set(object, "Good", CMPIBoolean{1}, CMPI_boolean), CMPI_RC_OK);
  EXPECT_EQ(set(object, "Size", CMPIUint16{1}, CMPI_uint16), CMPI_RC_OK);
  EXPECT_EQ(set(object, "name", "n"), CMPI_RC_OK);
  EXPECT_EQ(set(object, "NoSuch", "n"), CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_THAT(propertyNames(object), ::testing::ElementsAre("Size", "Name"));
  EXPECT_EQ(object->ft->setPropertyFilter(object, nullptr, nullptr).rc, CMPI_RC_OK);
  EXPECT_EQ(set(object, "Good", CMPIBoolean{1}, CMPI_boolean), CMPI_RC_OK);
  EXPECT_THAT(propertyNames(object), ::testing::ElementsAre("Size", "Name", "Good"));
}

TEST_F(ObjectsTest, AnEmptyFilterLetsTheKeysPass) {
  CMPIInstance* object = instance();
  const char* none[] = {nullptr};
  object->ft->setPropertyFilter(object, none, nullptr);
  set(object, "Size", CMPIUint16{1}, CMPI_uint16);
  set(object, "Name", "n");
  EXPECT_THAT(propertyNames(object), ::testing::ElementsAre("Name"));
}

TEST_F(ObjectsTest, ThePathOfAnInstanceHasItsKeysInTheSchemasOrder) {
  CMPIInstance* object = instance("T_Two");
  set(object, "Note", "n");
  set(object, "Second", CMPIUint32{2}, CMPI_uint32);
  set(object, "First", "f");
  CMPIObjectPath* name = object->ft->getObjectPath(object, &status_);
  EXPECT_EQ(shown(name), "root/cimv2:T_Two.First=\"f\",Second=2");
  name->ft->setNameSpace(name, "root/else");
  EXPECT_EQ(shown(object->ft->getObjectPath(object, &status_)), "root/cimv2:T_Two.First=\"f\",Second=2");
}

TEST_F(ObjectsTest, TheKeysOfThePathThatAnInstanceIsMadeFromAreItsProperties) {
  CMPIInstance* object = cmpi_->eft->newInstance(cmpi_, thing("a"), nullptr);
  EXPECT_EQ(textOf(get(object, "Name").value.string), "a");
  EXPECT_EQ(object->ft->setObjectPath(object, thing("b")).rc, CMPI_RC_OK);
  EXPECT_EQ(textOf(get(object, "Name").value.string), "b");
  EXPECT_EQ(object->ft->setObjectPath(object, path("T_Other")).rc, CMPI_RC_ERR_INVALID_CLASS);
}

TEST_F(ObjectsTest, AClassWithoutKeysKeepsThoseOfThePath) {
  CMPIObjectPath* loose = path("T_Keyless");
  addKey(loose, "Any", "thing");
  CMPIInstance* object = cmpi_->eft->newInstance(cmpi_, loose, nullptr);
  EXPECT_EQ(shown(object->ft->getObjectPath(object, nullptr)), "root/cimv2:T_Keyless.Any=\"thing\"");
}

TEST_F(ObjectsTest, ArraysHaveAFixedSizeAndOneType) {
  CMPIArray* array = cmpi_->eft->newArray(cmpi_, 2, CMPI_uint16, &status_);
  const CMPIUint16 number = 5;
  EXPECT_EQ(array->ft->setElementAt(array, 1, reinterpret_cast<const CMPIValue*>(&number), CMPI_uint16).rc, CMPI_RC_OK);
  EXPECT_EQ(array->ft->setElementAt(array, 2, reinterpret_cast<const CMPIValue*>(&number), CMPI_uint16).rc,
            CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(array->ft->setElementAt(array, 0, reinterpret_cast<const CMPIValue*>("x"), CMPI_chars).rc,
            CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(array->ft->getSize(array, nullptr), 2U);
  EXPECT_EQ(array->ft->getSimpleType(array, nullptr), CMPI_uint16);
  EXPECT_EQ(array->ft->getElementAt(array, 0, nullptr).state, CMPI_nullValue);
  EXPECT_EQ(array->ft->getElementAt(array, 1, nullptr).value.uint16, 5);
  array->ft->getElementAt(array, 2, &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(array->ft->setElementAt(array, 1, nullptr, CMPI_null).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(array), "{NULL, NULL}");
  EXPECT_EQ(cmpi_->eft->newArray(cmpi_, 2, CMPI_args, &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
}

TEST_F(ObjectsTest, AnArrayThatCannotBeHeldIsAnErrorNotACrash) {
  EXPECT_EQ(cmpi_->eft->newArray(cmpi_, std::numeric_limits<CMPICount>::max(), CMPI_string, &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_FAILED);
}

TEST_F(ObjectsTest, ArgumentsComeInOrderAndAreFoundByAnySpelling) {
  CMPIArgs* args = cmpi_->eft->newArgs(cmpi_, nullptr);
  args->ft->addArg(args, "Text", reinterpret_cast<const CMPIValue*>("x"), CMPI_chars);
  const CMPIUint16 times = 3;
  args->ft->addArg(args, "Times", reinterpret_cast<const CMPIValue*>(&times), CMPI_uint16);
  EXPECT_EQ(args->ft->getArgCount(args, nullptr), 2U);
  EXPECT_EQ(args->ft->getArg(args, "TIMES", nullptr).value.uint16, 3);
  CMPIString* name = nullptr;
  EXPECT_EQ(textOf(args->ft->getArgAt(args, 0, &name, nullptr).value.string), "x");
  EXPECT_EQ(textOf(name), "Text");
  args->ft->getArg(args, "None", &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
  args->ft->getArgAt(args, 2, &name, &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(shown(args), "(Text=\"x\", Times=3)");
}

TEST_F(ObjectsTest, DateTimesAreBinaryAndText) {
  CMPIDateTime* point = cmpi_->eft->newDateTimeFromChars(cmpi_, "19700101000001.000002+000", &status_);
  EXPECT_EQ(point->ft->getBinaryFormat(point, nullptr), 1000002U);
  EXPECT_EQ(point->ft->isInterval(point, nullptr), 0);
  CMPIDateTime* interval = cmpi_->eft->newDateTimeFromBinary(cmpi_, 60000000, 1, &status_);
  EXPECT_EQ(textOf(interval->ft->getStringFormat(interval, nullptr)), "00000000000100.000000:000");
  EXPECT_EQ(interval->ft->isInterval(interval, nullptr), 1);
  EXPECT_EQ(cmpi_->eft->newDateTimeFromChars(cmpi_, "yesterday", &status_), nullptr);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(cmpi_->eft->newDateTimeFromBinary(cmpi_, UINT64_MAX, 0, &status_), nullptr);
  CMPIDateTime* now = cmpi_->eft->newDateTime(cmpi_, &status_);
  EXPECT_GT(now->ft->getBinaryFormat(now, nullptr), 1700000000000000U);
  CMPIInstance* object = instance();
  CMPIValue value;
  value.dateTime = point;
  EXPECT_EQ(object->ft->setProperty(object, "Since", &value, CMPI_dateTime).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(get(object, "Since").value.dateTime), "19700101000001.000002+000");
}

TEST_F(ObjectsTest, EnumerationsAreReadOnceAndBecomeArraysWhole) {
  auto* list = scope_.arena().make<EnumerationObject>(scope_.arena(), CMPIType{CMPI_ref});
  for (const char* name : {"a", "b"}) {
    CMPIData data = nullData(CMPI_ref, CMPI_goodValue);
    data.value.ref = thing(name);
    list->append(data);
  }
  EXPECT_EQ(list->ft->hasNext(list, nullptr), 1);
  EXPECT_EQ(shown(list->ft->getNext(list, nullptr).value.ref), "root/cimv2:T_Thing.Name=\"a\"");
  list->ft->getNext(list, nullptr);
  EXPECT_EQ(list->ft->hasNext(list, nullptr), 0);
  list->ft->getNext(list, &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
  CMPIArray* array = list->ft->toArray(list, &status_);
  EXPECT_EQ(array->ft->getSize(array, nullptr), 2U);
  EXPECT_EQ(array->ft->getSimpleType(array, nullptr), CMPI_ref);
}

TEST_F(ObjectsTest, ErrorsKeepWhatTheyAreGiven) {
  CMPIError* error = cmpi_->eft->newCMPIError(cmpi_, "DMTF", "WIPG0205", "gone", ErrorSevHigh, Out_of_Memory,
                                              CMPI_RC_ERR_NOT_FOUND, &status_);
  EXPECT_EQ(error->ft->getOtherErrorType(error, nullptr), nullptr);
  error->ft->setErrorType(error, SoftwareError);
  error->ft->setOtherErrorType(error, "odd");
  error->ft->setProbableCauseDescription(error, "because");
  error->ft->setErrorSource(error, "here");
  error->ft->setErrorSourceFormat(error, CIMObjectHandle);
  error->ft->setOtherErrorSourceFormat(error, "other");
  error->ft->setCIMStatusCodeDescription(error, "not there");
  CMPIArray* texts = cmpi_->eft->newArray(cmpi_, 1, CMPI_string, nullptr);
  EXPECT_EQ(error->ft->setRecommendedActions(error, texts).rc, CMPI_RC_OK);
  EXPECT_EQ(error->ft->setMessageArguments(error, cmpi_->eft->newArray(cmpi_, 1, CMPI_uint8, nullptr)).rc,
            CMPI_RC_ERR_TYPE_MISMATCH);
  CMPIError* copy = error->ft->clone(error, &status_);
  EXPECT_EQ(copy->ft->getErrorType(copy, nullptr), SoftwareError);
  EXPECT_EQ(textOf(copy->ft->getOtherErrorType(copy, nullptr)), "odd");
  EXPECT_EQ(textOf(copy->ft->getOwningEntity(copy, nullptr)), "DMTF");
  EXPECT_EQ(textOf(copy->ft->getMessageID(copy, nullptr)), "WIPG0205");
  EXPECT_EQ(textOf(copy->ft->getMessage(copy, nullptr)), "gone");
  EXPECT_EQ(copy->ft->getPerceivedSeverity(copy, nullptr), ErrorSevHigh);
  EXPECT_EQ(copy->ft->getProbableCause(copy, nullptr), Out_of_Memory);
  EXPECT_EQ(textOf(copy->ft->getProbableCauseDescription(copy, nullptr)), "because");
  EXPECT_EQ(textOf(copy->ft->getErrorSource(copy, nullptr)), "here");
  EXPECT_EQ(copy->ft->getErrorSourceFormat(copy, nullptr), CIMObjectHandle);
  EXPECT_EQ(textOf(copy->ft->getOtherErrorSourceFormat(copy, nullptr)), "other");
  EXPECT_EQ(copy->ft->getCIMStatusCode(copy, nullptr), CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(textOf(copy->ft->getCIMStatusCodeDescription(copy, nullptr)), "not there");
  EXPECT_NE(copy->ft->getRecommendedActions(copy, nullptr), nullptr);
  EXPECT_EQ(copy->ft->getMessageArguments(copy, nullptr), nullptr);
  EXPECT_EQ(shown(copy), "CIM_ERR_NOT_FOUND WIPG0205: gone");
  copy->ft->release(copy);
}

TEST_F(ObjectsTest, ContextsAreFoundByNameAndByPlace) {
  auto* context = scope_.arena().make<ContextObject>(scope_.arena());
  context->setFlags(3);
  context->ft->addEntry(context, "Mine", reinterpret_cast<const CMPIValue*>("x"), CMPI_chars);
  EXPECT_EQ(context->ft->getEntryCount(context, nullptr), 2U);
  EXPECT_EQ(context->ft->getEntry(context, CMPIInvocationFlags, nullptr).value.uint32, 3U);
  CMPIString* name = nullptr;
  EXPECT_EQ(textOf(context->ft->getEntryAt(context, 1, &name, nullptr).value.string), "x");
  EXPECT_EQ(textOf(name), "Mine");
  context->ft->getEntry(context, CMPIPrincipal, &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(ObjectsTest, QualifiersComeFromTheSchema) {
  CMPIObjectPath* made = path();
  EXPECT_EQ(textOf(made->ft->getClassQualifier(made, "description", &status_).value.string), "A thing");
  EXPECT_EQ(made->ft->getPropertyQualifier(made, "name", "Key", &status_).value.boolean, 1);
  EXPECT_EQ(made->ft->getPropertyQualifier(made, "Name", "MaxLen", &status_).value.uint32, 64U);
  const CMPIData values = made->ft->getPropertyQualifier(made, "Size", "Values", &status_);
  EXPECT_EQ(shown(values.value.array), "{\"small\", \"large\"}");
  EXPECT_EQ(textOf(made->ft->getMethodQualifier(made, "echo", "Description", &status_).value.string), "Says it again");
  EXPECT_EQ(made->ft->getParameterQualifier(made, "Echo", "Said", "out", &status_).value.boolean, 1);
  EXPECT_EQ(status_.rc, CMPI_RC_OK);
  made->ft->getClassQualifier(made, "Key", &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
  made->ft->getParameterQualifier(made, "Echo", "None", "Out", &status_);
  EXPECT_EQ(status_.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(ObjectsTest, ACloneOutlivesTheScopeItWasMadeIn) {
  CMPIInstance* kept = nullptr;
  CMPIObjectPath* keptPath = nullptr;
  CMPIString* keptText = nullptr;
  {
    const Scope inner(BrokerCore::of(cmpi_)->classes(), BrokerCore::of(cmpi_)->blocks());
    CMPIInstance* object = instance();
    set(object, "Name", "long-lived, and longer than any buffer for short texts");
    CMPIArray* labels = cmpi_->eft->newArray(cmpi_, 1, CMPI_string, nullptr);
    labels->ft->setElementAt(labels, 0, reinterpret_cast<const CMPIValue*>("label"), CMPI_chars);
    CMPIValue value;
    value.array = labels;
    object->ft->setProperty(object, "Labels", &value, CMPI_stringA);
    kept = object->ft->clone(object, &status_);
    CMPIObjectPath* name = object->ft->getObjectPath(object, nullptr);
    keptPath = name->ft->clone(name, &status_);
    keptText = status_.rc == CMPI_RC_OK ? get(object, "Name").value.string : nullptr;
    keptText = keptText->ft->clone(keptText, nullptr);
  }
  EXPECT_EQ(textOf(get(kept, "Name").value.string), textOf(keptText));
  EXPECT_EQ(shown(get(kept, "Labels").value.array), "{\"label\"}");
  // The parts of a clone live as long as the clone.
  CMPIString* part = get(kept, "Name").value.string;
  EXPECT_EQ(part->ft->release(part).rc, CMPI_RC_OK);
  EXPECT_EQ(textOf(get(kept, "Name").value.string), textOf(keptText));
  addKey(keptPath, "Name", "changed");
  EXPECT_EQ(shown(keptPath), "root/cimv2:T_Thing.Name=\"changed\"");
  EXPECT_EQ(kept->ft->release(kept).rc, CMPI_RC_OK);
  EXPECT_EQ(keptPath->ft->release(keptPath).rc, CMPI_RC_OK);
  EXPECT_EQ(keptText->ft->release(keptText).rc, CMPI_RC_OK);
}

TEST_F(ObjectsTest, ReleasingWhatIsNoCloneIsHarmless) {
  CMPIObjectPath* made = thing("a");
  EXPECT_EQ(made->ft->release(made).rc, CMPI_RC_OK);
  EXPECT_EQ(made->ft->release(made).rc, CMPI_RC_OK);
  EXPECT_EQ(shown(made), "root/cimv2:T_Thing.Name=\"a\"");
  CMPIString* name = made->ft->getClassName(made, nullptr);
  EXPECT_EQ(name->ft->release(name).rc, CMPI_RC_OK);
  EXPECT_EQ(textOf(name), "T_Thing");
}

TEST_F(ObjectsTest, TypesAreReported) {
  EXPECT_EQ(textOf(cmpi_->eft->getType(cmpi_, path(), &status_)), "CMPIObjectPath");
  EXPECT_EQ(cmpi_->eft->isOfType(cmpi_, path(), "CMPIObjectPath", &status_), 1);
  EXPECT_EQ(cmpi_->eft->isOfType(cmpi_, path(), "CMPIInstance", &status_), 0);
  EXPECT_EQ(cmpi_->eft->classPathIsA(cmpi_, path("T_SpecialThing"), "t_base", &status_), 1);
  EXPECT_EQ(cmpi_->eft->classPathIsA(cmpi_, path("T_Other"), "T_Thing", &status_), 0);
  EXPECT_EQ(cmpi_->eft->classPathIsA(cmpi_, path("Foreign"), "T_Thing", &status_), 0);
}

TEST_F(ObjectsTest, ObjectsMadeAfterAMarkAreFreedAtItsRelease) {
  CMPIInstance* before = instance();
  CMPIGcStat* mark = cmpi_->mft->mark(cmpi_, &status_);
  ASSERT_NE(mark, nullptr);
  // A value belongs to the object that holds it, whenever it was set.
  set(before, "Name", "set after the mark");
  CMPIGcStat* inner = cmpi_->mft->mark(cmpi_, &status_);
  thing("goes");
  EXPECT_EQ(cmpi_->mft->release(cmpi_, mark).rc, CMPI_RC_OK);
  EXPECT_EQ(cmpi_->mft->release(cmpi_, inner).rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(textOf(get(before, "Name").value.string), "set after the mark");
}

TEST_F(ObjectsTest, MemoryIsFreedWithTheScope) {
  auto* block = static_cast<char*>(cmpi_->mft->cmpiCalloc(cmpi_, 4, 4));
  EXPECT_EQ(block[15], 0);
  block[15] = 'x';
  block = static_cast<char*>(cmpi_->mft->cmpiRealloc(cmpi_, block, 4096));
  EXPECT_EQ(block[15], 'x');
  cmpi_->mft->cmpiFree(cmpi_, block);
  EXPECT_STREQ(cmpi_->mft->cmpiStrDup(cmpi_, "left to the scope"), "left to the scope");
  EXPECT_NE(cmpi_->mft->cmpiRealloc(cmpi_, nullptr, 8), nullptr);
  int none = 0;
  cmpi_->mft->cmpiFree(cmpi_, &none);
  EXPECT_EQ(cmpi_->mft->cmpiRealloc(cmpi_, &none, 8), nullptr);
  EXPECT_EQ(cmpi_->mft->cmpiCalloc(cmpi_, SIZE_MAX, 2), nullptr);
}

TEST_F(ObjectsTest, AnArrayWithoutElementsWritesIntoItsOwnMemory) {
  Arena arena(nullptr);
  const auto* const empty = reinterpret_cast<const char*>(arena.makeArray<CMPIData>(0));
  const auto* const next = static_cast<const char*>(arena.allocate(1));
  EXPECT_GE(next - empty, static_cast<std::ptrdiff_t>(sizeof(CMPIData)));
}

#ifdef ZORVA_FORBIDS_FREE_MEMORY
TEST_F(ObjectsTest, AddressSanitizerKnowsWhatAnArenaHasNotGivenOut) {
  Arena arena(nullptr);
  for (const std::size_t size : {1U, 24U, 100U, 100000U}) {
    const auto* const memory = static_cast<const char*>(arena.allocate(size));
    EXPECT_EQ(__asan_region_is_poisoned(const_cast<char*>(memory), size), nullptr) << size;
    EXPECT_TRUE(__asan_address_is_poisoned(memory + size)) << size;
  }
}
#endif

TEST_F(ObjectsTest, AnArenaSharesTextsThatRepeat) {
  Arena arena(nullptr);
  EXPECT_EQ(intern(arena, "root/cimv2"), intern(arena, "root/cimv2"));
  EXPECT_NE(intern(arena, "a"), intern(arena, "b"));
  const std::size_t before = arena.size();
  for (int i = 0; i < 10000; ++i) intern(arena, "root/cimv2");
  EXPECT_EQ(arena.size(), before);
}

TEST_F(ObjectsTest, ALargeTextDoesNotWasteABlock) {
  Arena arena(nullptr, 4096);
  arena.text("small");
  const std::size_t before = arena.size();
  arena.text(std::string(1U << 20U, 'x'));
  arena.text("small");
  EXPECT_LT(arena.size(), before + (1U << 20U) + 1024);
}

}  // namespace
}  // namespace zorva::broker
