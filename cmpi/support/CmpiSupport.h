#pragma once

// Small wrappers of the C interface, so that an operation reads like its description.
//
// Every function here accepts null objects and objects without a handle: nothing is called on such an object, and what
// would be read from it is empty. rc is passed to each CMPI call that takes a status and is never set here; it may be
// null. Texts are UTF-8; a text ends at its first NUL. Thread-safe if the objects are.

#include <cmpidt.h>
#include <cmpift.h>

#include <span>
#include <string>
#include <vector>

namespace zorva::cmpi {

constexpr CMPIStatus kStatusOk = {CMPI_RC_OK, nullptr};

/// Whether an object and its handle exist.
template <typename Object>
bool isGood(const Object* object) {
  return object != nullptr && object->hdl != nullptr;
}

/// The string or the array object in a datum; null if there is none. Only the value is checked: servers leave any state
/// beside a good value.
const CMPIString* stringOf(const CMPIData& data);
const CMPIArray* arrayOf(const CMPIData& data);

std::string textOf(const CMPIString* string, CMPIStatus* rc);

/// The value of a datum: a text of either of CMPI's two text types; empty for every other type.
std::string textOf(const CMPIData& data, CMPIStatus* rc);

std::string nameSpaceOf(const CMPIObjectPath* path, CMPIStatus* rc);
std::string classNameOf(const CMPIObjectPath* path, CMPIStatus* rc);
CMPIData getKey(const CMPIObjectPath* path, const char* name, CMPIStatus* rc);
std::string keyText(const CMPIObjectPath* path, const char* name, CMPIStatus* rc);
CMPIData getProperty(const CMPIInstance* instance, const char* name, CMPIStatus* rc);
std::string propertyText(const CMPIInstance* instance, const char* name, CMPIStatus* rc);
CMPIObjectPath* objectPathOf(const CMPIInstance* instance, CMPIStatus* rc);
CMPICount keyCountOf(const CMPIObjectPath* path, CMPIStatus* rc);

/// New objects belong to the broker. The broker's result is returned unchanged, good or not.
CMPIObjectPath* newPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className, CMPIStatus* rc);
CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus* rc);
CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType elementType, CMPIStatus* rc);

/// A string for an array element; null if the broker left a code in rc or made no good one.
CMPIString* newString(const CMPIBroker* broker, const std::string& text, CMPIStatus* rc);

void setNameSpace(CMPIObjectPath* path, const std::string& nameSpace);

void addTextKey(CMPIObjectPath* path, const char* name, const std::string& text);
void addReferenceKey(CMPIObjectPath* path, const char* name, const CMPIObjectPath* reference);

/// Return what setProperty returned; ok if there is no instance. A property that a broker refuses stays unset, and most
/// callers ignore that.
CMPIStatus setText(const CMPIInstance* instance, const char* name, const std::string& text);
CMPIStatus setUint8(const CMPIInstance* instance, const char* name, CMPIUint8 number);
CMPIStatus setUint16(const CMPIInstance* instance, const char* name, CMPIUint16 number);
CMPIStatus setUint64(const CMPIInstance* instance, const char* name, CMPIUint64 number);
CMPIStatus setBoolean(const CMPIInstance* instance, const char* name, bool value);
CMPIStatus setReference(const CMPIInstance* instance, const char* name, const CMPIObjectPath* reference);
CMPIStatus setArray(const CMPIInstance* instance, const char* name, CMPIArray* array, CMPIType arrayType);

/// A null ends each of the lists. A null list of properties means all.
void setPropertyFilter(CMPIInstance* instance, const char** properties, const char* const* keys);

CMPIStatus setTextElement(CMPIArray* array, CMPICount index, CMPIString* string);
CMPIStatus setUint16Element(CMPIArray* array, CMPICount index, CMPIUint16 number);

/// The broker's enumerations of other providers' objects. Null if there is no broker.
CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* broker, const CMPIContext* context,
                                        const CMPIObjectPath* path, CMPIStatus* rc);
CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                    CMPIStatus* rc);
bool hasNext(const CMPIEnumeration* enumeration, CMPIStatus* rc);
CMPIObjectPath* nextPath(const CMPIEnumeration* enumeration, CMPIStatus* rc);
CMPIInstance* nextInstance(const CMPIEnumeration* enumeration, CMPIStatus* rc);

/// Return one result. A null instance or path is passed on too: the server decides what it means.
CMPIStatus returnInstance(const CMPIResult* result, const CMPIInstance* instance);
CMPIStatus returnObjectPath(const CMPIResult* result, const CMPIObjectPath* path);
CMPIStatus returnDone(const CMPIResult* result);

/// The elements of a result vector are counted in 16 bits.
template <typename Element>
unsigned short count16(const std::vector<Element>& elements) {
  return static_cast<unsigned short>(elements.size());
}

/// The elements that a 16-bit count covers.
template <typename Element>
std::span<const Element> counted16(const std::vector<Element>& elements) {
  return {elements.data(), count16(elements)};
}

/// Which properties of an instance a request asks for, by exact name. Without a list: all, or none if only the keys are
/// requested. With a list, even an empty one: those on the list. The list outlives this.
class WantedProperties {
 public:
  WantedProperties(const char** properties, bool keysOnly) : properties_(properties), keysOnly_(keysOnly) {}
  bool operator()(const char* name) const;

 private:
  const char** properties_;
  bool keysOnly_;
};

}  // namespace zorva::cmpi
