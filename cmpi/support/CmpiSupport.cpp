#include "cmpi/support/CmpiSupport.h"

#include <cstring>

namespace zorva::cmpi {

namespace {

constexpr CMPIData kNoData = {CMPI_null, CMPI_nullValue, {}};

// For text values, the function tables take the text's pointer itself, not a pointer to a value.
const CMPIValue* asValue(const char* text) { return reinterpret_cast<const CMPIValue*>(text); }

template <typename Member, typename Value>
CMPIStatus set(const CMPIInstance* instance, const char* name, Member CMPIValue::*member, Value value, CMPIType type) {
  if (!isGood(instance)) return kStatusOk;
  CMPIValue cmpiValue{};
  cmpiValue.*member = value;
  return instance->ft->setProperty(instance, name, &cmpiValue, type);
}

}  // namespace

const CMPIString* stringOf(const CMPIData& data) { return data.type == CMPI_string ? data.value.string : nullptr; }

const CMPIArray* arrayOf(const CMPIData& data) { return (data.type & CMPI_ARRAY) != 0 ? data.value.array : nullptr; }

std::string textOf(const CMPIString* string, CMPIStatus* rc) {
  if (!isGood(string)) return {};
  const char* text = string->ft->getCharPtr(string, rc);
  return text != nullptr ? text : "";
}

std::string textOf(const CMPIData& data, CMPIStatus* rc) {
  if (data.type == CMPI_chars && data.value.chars != nullptr) return data.value.chars;
  return textOf(stringOf(data), rc);
}

std::string nameSpaceOf(const CMPIObjectPath* path, CMPIStatus* rc) {
  return isGood(path) ? textOf(path->ft->getNameSpace(path, rc), rc) : std::string();
}

std::string classNameOf(const CMPIObjectPath* path, CMPIStatus* rc) {
  return isGood(path) ? textOf(path->ft->getClassName(path, rc), rc) : std::string();
}

CMPIData getKey(const CMPIObjectPath* path, const char* name, CMPIStatus* rc) {
  return isGood(path) ? path->ft->getKey(path, name, rc) : kNoData;
}

std::string keyText(const CMPIObjectPath* path, const char* name, CMPIStatus* rc) {
  return textOf(getKey(path, name, rc), rc);
}

CMPIData getProperty(const CMPIInstance* instance, const char* name, CMPIStatus* rc) {
  return isGood(instance) ? instance->ft->getProperty(instance, name, rc) : kNoData;
}

std::string propertyText(const CMPIInstance* instance, const char* name, CMPIStatus* rc) {
  return textOf(getProperty(instance, name, rc), rc);
}

CMPIObjectPath* objectPathOf(const CMPIInstance* instance, CMPIStatus* rc) {
  return isGood(instance) ? instance->ft->getObjectPath(instance, rc) : nullptr;
}

CMPICount keyCountOf(const CMPIObjectPath* path, CMPIStatus* rc) {
  return isGood(path) ? path->ft->getKeyCount(path, rc) : 0;
}

CMPIObjectPath* newPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className, CMPIStatus* rc) {
  return broker != nullptr ? broker->eft->newObjectPath(broker, nameSpace.c_str(), className, rc) : nullptr;
}

CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus* rc) {
  return broker != nullptr && isGood(path) ? broker->eft->newInstance(broker, path, rc) : nullptr;
}

CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType elementType, CMPIStatus* rc) {
  return broker != nullptr ? broker->eft->newArray(broker, size, elementType, rc) : nullptr;
}

CMPIString* newString(const CMPIBroker* broker, const std::string& text, CMPIStatus* rc) {
  if (broker == nullptr) return nullptr;
  CMPIString* string = broker->eft->newString(broker, text.c_str(), rc);
  return (rc != nullptr && rc->rc != CMPI_RC_OK) || !isGood(string) ? nullptr : string;
}

void setNameSpace(CMPIObjectPath* path, const std::string& nameSpace) {
  if (isGood(path)) path->ft->setNameSpace(path, nameSpace.c_str());
}

void addTextKey(CMPIObjectPath* path, const char* name, const std::string& text) {
  if (isGood(path)) path->ft->addKey(path, name, asValue(text.c_str()), CMPI_chars);
}

void addReferenceKey(CMPIObjectPath* path, const char* name, const CMPIObjectPath* reference) {
  if (!isGood(path) || !isGood(reference)) return;
  CMPIValue value{};
  value.ref = const_cast<CMPIObjectPath*>(reference);  // CMPI's value type has no const form; the broker copies it
  path->ft->addKey(path, name, &value, CMPI_ref);
}

CMPIStatus setText(const CMPIInstance* instance, const char* name, const std::string& text) {
  if (!isGood(instance)) return kStatusOk;
  return instance->ft->setProperty(instance, name, asValue(text.c_str()), CMPI_chars);
}

CMPIStatus setUint8(const CMPIInstance* instance, const char* name, CMPIUint8 number) {
  return set(instance, name, &CMPIValue::uint8, number, CMPI_uint8);
}

CMPIStatus setUint16(const CMPIInstance* instance, const char* name, CMPIUint16 number) {
  return set(instance, name, &CMPIValue::uint16, number, CMPI_uint16);
}

CMPIStatus setUint64(const CMPIInstance* instance, const char* name, CMPIUint64 number) {
  return set(instance, name, &CMPIValue::uint64, number, CMPI_uint64);
}

CMPIStatus setBoolean(const CMPIInstance* instance, const char* name, bool value) {
  return set(instance, name, &CMPIValue::boolean, static_cast<CMPIBoolean>(value), CMPI_boolean);
}

CMPIStatus setReference(const CMPIInstance* instance, const char* name, const CMPIObjectPath* reference) {
  if (!isGood(reference)) return kStatusOk;
  return set(instance, name, &CMPIValue::ref, const_cast<CMPIObjectPath*>(reference), CMPI_ref);
}

CMPIStatus setArray(const CMPIInstance* instance, const char* name, CMPIArray* array, CMPIType arrayType) {
  return isGood(array) ? set(instance, name, &CMPIValue::array, array, arrayType) : kStatusOk;
}

void setPropertyFilter(CMPIInstance* instance, const char** properties, const char* const* keys) {
  if (!isGood(instance)) return;
  instance->ft->setPropertyFilter(instance, properties,
                                  const_cast<const char**>(keys));  // CMPI's list has no const form
}

CMPIStatus setTextElement(CMPIArray* array, CMPICount index, CMPIString* string) {
  if (!isGood(array)) return kStatusOk;
  CMPIValue value{};
  value.string = string;
  return array->ft->setElementAt(array, index, &value, CMPI_string);
}

CMPIStatus setUint16Element(CMPIArray* array, CMPICount index, CMPIUint16 number) {
  if (!isGood(array)) return kStatusOk;
  CMPIValue value{};
  value.uint16 = number;
  return array->ft->setElementAt(array, index, &value, CMPI_uint16);
}

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* broker, const CMPIContext* context,
                                        const CMPIObjectPath* path, CMPIStatus* rc) {
  return broker != nullptr ? broker->bft->enumerateInstanceNames(broker, context, path, rc) : nullptr;
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                    CMPIStatus* rc) {
  return broker != nullptr ? broker->bft->enumerateInstances(broker, context, path, nullptr, rc) : nullptr;
}

bool hasNext(const CMPIEnumeration* enumeration, CMPIStatus* rc) {
  return isGood(enumeration) && enumeration->ft->hasNext(enumeration, rc) != 0;
}

CMPIObjectPath* nextPath(const CMPIEnumeration* enumeration, CMPIStatus* rc) {
  if (!isGood(enumeration)) return nullptr;
  const CMPIData data = enumeration->ft->getNext(enumeration, rc);
  return data.type == CMPI_ref ? data.value.ref : nullptr;
}

CMPIInstance* nextInstance(const CMPIEnumeration* enumeration, CMPIStatus* rc) {
  if (!isGood(enumeration)) return nullptr;
  const CMPIData data = enumeration->ft->getNext(enumeration, rc);
  return data.type == CMPI_instance ? data.value.inst : nullptr;
}

CMPIStatus returnInstance(const CMPIResult* result, const CMPIInstance* instance) {
  return result != nullptr ? result->ft->returnInstance(result, instance) : kStatusOk;
}

CMPIStatus returnObjectPath(const CMPIResult* result, const CMPIObjectPath* path) {
  return result != nullptr ? result->ft->returnObjectPath(result, path) : kStatusOk;
}

CMPIStatus returnDone(const CMPIResult* result) {
  return result != nullptr ? result->ft->returnDone(result) : kStatusOk;
}

bool WantedProperties::operator()(const char* name) const {
  if (properties_ == nullptr) return !keysOnly_;
  const char** listed = properties_;
  while (*listed != nullptr && std::strcmp(*listed, name) != 0) ++listed;
  return *listed != nullptr;
}

}  // namespace zorva::cmpi
