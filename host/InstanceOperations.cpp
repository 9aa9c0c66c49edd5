#include "host/InstanceOperations.h"

#include <cmpift.h>
#include <strings.h>

#include <cstring>
#include <string>
#include <utility>

#include "agent/Agent.h"
#include "cmpi/support/CmpiSupport.h"

namespace zorva::host {

using namespace zorva::cmpi;

namespace {

CMPIStatus failure(const CMPIBroker* broker, CMPIrc rc, const std::string& text) {
  return {rc, broker->eft->newString(broker, text.c_str(), nullptr)};
}

CMPIObjectPath* makePath(const CMPIBroker* broker, const std::string& nameSpace, const HostObject& object,
                         CMPIStatus* status) {
  CMPIObjectPath* path = newPath(broker, nameSpace, object.className, status);
  for (const HostProperty& key : object.keys) addTextKey(path, key.name, std::get<std::string>(key.value));
  return path;
}

// Sets one property, in the CMPI type of its value.
class PropertySetter {
 public:
  PropertySetter(const CMPIBroker* broker, const CMPIInstance* instance) : broker_(broker), instance_(instance) {}

  CMPIStatus set(const HostProperty& property) {
    return std::visit([&](const auto& value) { return set(property.name, value); }, property.value);
  }

 private:
  CMPIStatus set(const char* name, const std::string& text) { return setText(instance_, name, text); }
  CMPIStatus set(const char* name, std::uint8_t number) { return setUint8(instance_, name, number); }
  CMPIStatus set(const char* name, std::uint16_t number) { return setUint16(instance_, name, number); }
  CMPIStatus set(const char* name, std::uint64_t number) { return setUint64(instance_, name, number); }
  CMPIStatus set(const char* name, bool value) { return setBoolean(instance_, name, value); }
  CMPIStatus set(const char* name, const std::vector<std::string>& texts) {
    return setElements(name, texts, CMPI_string, [&](CMPIArray* array, CMPICount i) {
      setTextElement(array, i, newString(broker_, texts[i], nullptr));
    });
  }
  CMPIStatus set(const char* name, const std::vector<std::uint16_t>& numbers) {
    return setElements(name, numbers, CMPI_uint16,
                       [&](CMPIArray* array, CMPICount i) { setUint16Element(array, i, numbers[i]); });
  }

  template <typename Element, typename SetElement>
  CMPIStatus setElements(const char* name, const std::vector<Element>& elements, CMPIType elementType,
                         SetElement setElement) {
    CMPIStatus status = kStatusOk;
    CMPIArray* array = newArray(broker_, static_cast<CMPICount>(elements.size()), elementType, &status);
    if (array == nullptr) return status.rc != CMPI_RC_OK ? status : CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
    for (CMPICount i = 0; i < elements.size(); ++i) setElement(array, i);
    return setArray(instance_, name, array, static_cast<CMPIType>(elementType | CMPI_ARRAY));
  }

  const CMPIBroker* broker_;
  const CMPIInstance* instance_;
};

bool isWanted(const char* name, const char** properties) {
  if (properties == nullptr) return true;
  for (; *properties != nullptr; ++properties) {
    if (strcasecmp(name, *properties) == 0) return true;
  }
  return false;
}

CMPIStatus returnObject(const CMPIBroker* broker, const CMPIResult* result, const std::string& nameSpace,
                        const HostObject& object, const char** properties) {
  CMPIStatus status = kStatusOk;
  CMPIInstance* instance = newInstance(broker, makePath(broker, nameSpace, object, &status), &status);
  if (instance == nullptr) return failure(broker, CMPI_RC_ERR_FAILED, "the broker made no instance");

  std::vector<const char*> keys;
  for (const HostProperty& key : object.keys) keys.push_back(key.name);
  keys.push_back(nullptr);
  setPropertyFilter(instance, properties, keys.data());
  PropertySetter setter(broker, instance);
  for (const HostProperty& key : object.keys) setter.set(key);
  for (const HostProperty& property : object.properties) {
    if (!isWanted(property.name, properties)) continue;
    status = setter.set(property);
    if (status.rc != CMPI_RC_OK) return status;
  }
  return returnInstance(result, instance);
}

bool namesAClass(const char* key) { return std::strstr(key, "CreationClassName") != nullptr; }

bool hasKeysOf(const HostObject& object, const CMPIObjectPath* ref) {
  if (keyCountOf(ref, nullptr) != object.keys.size()) return false;
  for (const HostProperty& key : object.keys) {
    CMPIStatus status = kStatusOk;
    const CMPIData data = getKey(ref, key.name, &status);
    if (status.rc != CMPI_RC_OK || (data.type != CMPI_string && data.type != CMPI_chars)) return false;
    if (data.type == CMPI_chars && data.value.chars == nullptr) return false;
    const std::string asked = textOf(data, nullptr);
    const std::string& own = std::get<std::string>(key.value);
    const bool equal = namesAClass(key.name) ? strcasecmp(asked.c_str(), own.c_str()) == 0 : asked == own;
    if (!equal) return false;
  }
  return true;
}

// Calls the function with each object of one class, until it returns a failure or says to stop.
template <typename Handle>
CMPIStatus forEachObject(const CMPIBroker* broker, const Publish& publish, const std::string& className,
                         Handle handle) try {
  for (const HostObject& object : publish(*zorva::agent::currentTree())) {
    if (strcasecmp(object.className, className.c_str()) != 0) continue;
    const CMPIStatus status = handle(object);
    if (status.rc != CMPI_RC_OK) return status;
  }
  return kStatusOk;
} catch (const std::exception& error) {
  return failure(broker, CMPI_RC_ERR_FAILED, std::string("the host cannot be read: ") + error.what());
}

}  // namespace

CMPIStatus enumerateInstanceNames(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                                  const CMPIObjectPath* ref) {
  const std::string nameSpace = nameSpaceOf(ref, nullptr);
  const CMPIStatus status = forEachObject(broker, publish, classNameOf(ref, nullptr), [&](const HostObject& object) {
    CMPIStatus made = kStatusOk;
    const CMPIObjectPath* path = makePath(broker, nameSpace, object, &made);
    if (path == nullptr) return failure(broker, CMPI_RC_ERR_FAILED, "the broker made no object path");
    return returnObjectPath(result, path);
  });
  if (status.rc == CMPI_RC_OK) returnDone(result);
  return status;
}

CMPIStatus enumerateInstances(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                              const CMPIObjectPath* ref, const char** properties) {
  const std::string nameSpace = nameSpaceOf(ref, nullptr);
  const CMPIStatus status = forEachObject(broker, publish, classNameOf(ref, nullptr), [&](const HostObject& object) {
    return returnObject(broker, result, nameSpace, object, properties);
  });
  if (status.rc == CMPI_RC_OK) returnDone(result);
  return status;
}

CMPIStatus getInstance(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                       const CMPIObjectPath* ref, const char** properties) {
  bool found = false;
  const std::string nameSpace = nameSpaceOf(ref, nullptr);
  const std::string className = classNameOf(ref, nullptr);
  const CMPIStatus status = forEachObject(broker, publish, className, [&](const HostObject& object) {
    if (found || !hasKeysOf(object, ref)) return kStatusOk;
    found = true;
    return returnObject(broker, result, nameSpace, object, properties);
  });
  if (status.rc != CMPI_RC_OK) return status;
  if (!found) return failure(broker, CMPI_RC_ERR_NOT_FOUND, "this host has no " + className + " with these keys");
  returnDone(result);
  return kStatusOk;
}

CMPIStatus refuse(const CMPIBroker* broker, const char* operation) {
  return failure(broker, CMPI_RC_ERR_NOT_SUPPORTED,
                 std::string(operation) + " is not supported: the objects are as the host has them");
}

}  // namespace zorva::host
