// What takes the noise of the C interface away, so that an operation reads like the sentence that describes it.
//
// Every function here takes null objects and objects without a handle: nothing is called on such an object, and what
// would have been read from it is empty. rc is handed to each CMPI call that takes a status and is never set here; it
// may be null. Texts are UTF-8; a text ends at its first NUL. Thread-safe as far as the objects are.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <span>
#include <string>
#include <unordered_set>
#include <vector>

namespace ZV {

constexpr CMPIStatus kStatusOk = {CMPI_RC_OK, nullptr};

// Whether there is an object to work with.
template <typename Object>
bool isGood(const Object* object) {
  return object != nullptr && object->hdl != nullptr;
}

// The string or the array object in a datum; null where it holds none. The value alone says whether one is there:
// servers leave any state beside a good value.
const CMPIString* stringOf(const CMPIData& data);
const CMPIArray* arrayOf(const CMPIData& data);

std::string textOf(const CMPIString* string, CMPIStatus* rc);

// Of the value of a datum: a text of either of CMPI's two text types; empty for every other type.
std::string textOf(const CMPIData& data, CMPIStatus* rc);

std::string nameSpaceOf(const CMPIObjectPath* path, CMPIStatus* rc);
std::string classNameOf(const CMPIObjectPath* path, CMPIStatus* rc);
CMPIData getKey(const CMPIObjectPath* path, const char* name, CMPIStatus* rc);
std::string keyText(const CMPIObjectPath* path, const char* name, CMPIStatus* rc);
CMPIData getProperty(const CMPIInstance* instance, const char* name, CMPIStatus* rc);
std::string propertyText(const CMPIInstance* instance, const char* name, CMPIStatus* rc);
CMPIObjectPath* objectPathOf(const CMPIInstance* instance, CMPIStatus* rc);
CMPICount keyCountOf(const CMPIObjectPath* path, CMPIStatus* rc);

// New objects belong to the broker. What the broker gave comes back as it is, good or not.
CMPIObjectPath* newPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className, CMPIStatus* rc);
CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus* rc);
CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType elementType, CMPIStatus* rc);

// A string for an array element; null where the broker left a code in rc or made none that is good.
CMPIString* newString(const CMPIBroker* broker, const std::string& text, CMPIStatus* rc);

void setNameSpace(CMPIObjectPath* path, const std::string& nameSpace);

// Every path is told this system's name anew as its host.
void setNameSpaceAndHost(CMPIObjectPath* path, const std::string& nameSpace);

// A new path with that namespace and this system's name as its host; what the broker gave, good or not.
CMPIObjectPath* newHostPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                            CMPIStatus* rc);

void addTextKey(CMPIObjectPath* path, const char* name, const std::string& text);
void addReferenceKey(CMPIObjectPath* path, const char* name, const CMPIObjectPath* reference);

// The results of setProperty are not looked at: what a broker refuses stays unset.
void setText(const CMPIInstance* instance, const char* name, const std::string& text);
void setUint16(const CMPIInstance* instance, const char* name, CMPIUint16 number);
void setUint64(const CMPIInstance* instance, const char* name, CMPIUint64 number);
void setBoolean(const CMPIInstance* instance, const char* name, bool value);
void setReference(const CMPIInstance* instance, const char* name, const CMPIObjectPath* reference);
void setArray(const CMPIInstance* instance, const char* name, CMPIArray* array, CMPIType arrayType);
void setPropertyFilter(CMPIInstance* instance, const char** properties, std::vector<const char*> keys);

CMPIStatus setTextElement(CMPIArray* array, CMPICount index, CMPIString* string);
CMPIStatus setUint16Element(CMPIArray* array, CMPICount index, CMPIUint16 number);

// The broker's enumerations of what other providers serve. Null where there is no broker to ask.
CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* broker, const CMPIContext* context,
                                        const CMPIObjectPath* path, CMPIStatus* rc);
CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                    CMPIStatus* rc);
bool hasNext(const CMPIEnumeration* enumeration, CMPIStatus* rc);
CMPIObjectPath* nextPath(const CMPIEnumeration* enumeration, CMPIStatus* rc);
CMPIInstance* nextInstance(const CMPIEnumeration* enumeration, CMPIStatus* rc);

// Hand out one result. A null instance or path is handed on as it is: what it means is the server's to say.
void returnInstance(const CMPIResult* result, const CMPIInstance* instance);
void returnObjectPath(const CMPIResult* result, const CMPIObjectPath* path);
void returnDone(const CMPIResult* result);

// The elements of a result vector are counted in 16 bits.
template <typename Element>
unsigned short count16(const std::vector<Element>& elements) {
  return static_cast<unsigned short>(elements.size());
}

// The elements that this count takes in.
template <typename Element>
std::span<const Element> counted16(const std::vector<Element>& elements) {
  return {elements.data(), count16(elements)};
}

// Which properties of an instance a request asks for, by exact name. Without a list that is every one, or none where
// only the keys are wanted; with a list, an empty one included, it is what stands on it.
class WantedProperties {
 public:
  WantedProperties(const char** properties, bool keysOnly);
  bool operator()(const char* name) const;

 private:
  std::unordered_set<std::string> names_;
  bool all_;
};

}  // namespace ZV
