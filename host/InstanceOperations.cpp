#include "host/InstanceOperations.h"

#include <cmpift.h>
#include <strings.h>

#include <cstring>
#include <string>
#include <string_view>

#include "agent/Agent.h"

namespace zorva::host {

namespace {

constexpr CMPIStatus kOk = {CMPI_RC_OK, nullptr};

CMPIStatus failure(const CMPIBroker* broker, CMPIrc rc, const std::string& text) {
  return {rc, broker->eft->newString(broker, text.c_str(), nullptr)};
}

std::string textOf(const CMPIString* string) {
  const char* text = string != nullptr ? string->ft->getCharPtr(string, nullptr) : nullptr;
  return text != nullptr ? text : "";
}

std::string nameSpaceOf(const CMPIObjectPath* path) { return textOf(path->ft->getNameSpace(path, nullptr)); }
std::string classNameOf(const CMPIObjectPath* path) { return textOf(path->ft->getClassName(path, nullptr)); }

const CMPIValue* asValue(const std::string& text) { return reinterpret_cast<const CMPIValue*>(text.c_str()); }

CMPIObjectPath* makePath(const CMPIBroker* broker, const std::string& nameSpace, const HostObject& object,
                         CMPIStatus* status) {
  CMPIObjectPath* path = broker->eft->newObjectPath(broker, nameSpace.c_str(), object.className, status);
  if (path == nullptr) return nullptr;
  for (const HostProperty& key : object.keys) {
    path->ft->addKey(path, key.name, asValue(std::get<std::string>(key.value)), CMPI_chars);
  }
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
  CMPIStatus set(const char* name, const std::string& text) {
    return instance_->ft->setProperty(instance_, name, asValue(text), CMPI_chars);
  }
  CMPIStatus set(const char* name, std::uint8_t number) {
    CMPIValue value{};
    value.uint8 = number;
    return instance_->ft->setProperty(instance_, name, &value, CMPI_uint8);
  }
  CMPIStatus set(const char* name, std::uint16_t number) {
    CMPIValue value{};
    value.uint16 = number;
    return instance_->ft->setProperty(instance_, name, &value, CMPI_uint16);
  }
  CMPIStatus set(const char* name, const std::vector<std::string>& texts) {
    return setArray(name, texts, CMPI_string, CMPI_stringA, [&](const std::string& text) {
      CMPIValue value{};
      value.string = broker_->eft->newString(broker_, text.c_str(), nullptr);
      return value;
    });
  }
  CMPIStatus set(const char* name, const std::vector<std::uint16_t>& numbers) {
    return setArray(name, numbers, CMPI_uint16, CMPI_uint16A, [](std::uint16_t number) {
      CMPIValue value{};
      value.uint16 = number;
      return value;
    });
  }

  template <typename Element, typename ToValue>
  CMPIStatus setArray(const char* name, const std::vector<Element>& elements, CMPIType elementType, CMPIType arrayType,
                      ToValue toValue) {
    CMPIStatus status = kOk;
    CMPIArray* array = broker_->eft->newArray(broker_, static_cast<CMPICount>(elements.size()), elementType, &status);
    if (array == nullptr) return status.rc != CMPI_RC_OK ? status : CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
    for (CMPICount i = 0; i < elements.size(); ++i) {
      const CMPIValue value = toValue(elements[i]);
      array->ft->setElementAt(array, i, &value, elementType);
    }
    CMPIValue value{};
    value.array = array;
    return instance_->ft->setProperty(instance_, name, &value, arrayType);
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

CMPIStatus returnInstance(const CMPIBroker* broker, const CMPIResult* result, const std::string& nameSpace,
                          const HostObject& object, const char** properties) {
  CMPIStatus status = kOk;
  const CMPIObjectPath* path = makePath(broker, nameSpace, object, &status);
  CMPIInstance* instance = path != nullptr ? broker->eft->newInstance(broker, path, &status) : nullptr;
  if (instance == nullptr) return failure(broker, CMPI_RC_ERR_FAILED, "the broker made no instance");

  std::vector<const char*> keys;
  for (const HostProperty& key : object.keys) keys.push_back(key.name);
  keys.push_back(nullptr);
  instance->ft->setPropertyFilter(instance, properties, keys.data());
  PropertySetter setter(broker, instance);
  for (const HostProperty& key : object.keys) setter.set(key);
  for (const HostProperty& property : object.properties) {
    if (!isWanted(property.name, properties)) continue;
    status = setter.set(property);
    if (status.rc != CMPI_RC_OK) return status;
  }
  return result->ft->returnInstance(result, instance);
}

bool namesAClass(const char* key) { return std::strstr(key, "CreationClassName") != nullptr; }

bool hasKeysOf(const HostObject& object, const CMPIObjectPath* ref) {
  if (ref->ft->getKeyCount(ref, nullptr) != object.keys.size()) return false;
  for (const HostProperty& key : object.keys) {
    CMPIStatus status = kOk;
    const CMPIData data = ref->ft->getKey(ref, key.name, &status);
    if (status.rc != CMPI_RC_OK || (data.type != CMPI_string && data.type != CMPI_chars)) return false;
    if (data.type == CMPI_chars && data.value.chars == nullptr) return false;
    const std::string asked = data.type == CMPI_chars ? data.value.chars : textOf(data.value.string);
    const std::string& own = std::get<std::string>(key.value);
    const bool equal = namesAClass(key.name) ? strcasecmp(asked.c_str(), own.c_str()) == 0 : asked == own;
    if (!equal) return false;
  }
  return true;
}

// Calls the function with each object of one class, until it returns a failure or says to stop.
template <typename Handle>
CMPIStatus forEachObject(const CMPIBroker* broker, Publish publish, const std::string& className, Handle handle) try {
  for (const HostObject& object : publish(*zorva::agent::currentTree())) {
    if (strcasecmp(object.className, className.c_str()) != 0) continue;
    const CMPIStatus status = handle(object);
    if (status.rc != CMPI_RC_OK) return status;
  }
  return kOk;
} catch (const std::exception& error) {
  return failure(broker, CMPI_RC_ERR_FAILED, std::string("the host cannot be read: ") + error.what());
}

}  // namespace

CMPIStatus enumerateInstanceNames(const CMPIBroker* broker, Publish publish, const CMPIResult* result,
                                  const CMPIObjectPath* ref) {
  const std::string nameSpace = nameSpaceOf(ref);
  const CMPIStatus status = forEachObject(broker, publish, classNameOf(ref), [&](const HostObject& object) {
    CMPIStatus made = kOk;
    const CMPIObjectPath* path = makePath(broker, nameSpace, object, &made);
    if (path == nullptr) return failure(broker, CMPI_RC_ERR_FAILED, "the broker made no object path");
    return result->ft->returnObjectPath(result, path);
  });
  if (status.rc == CMPI_RC_OK) result->ft->returnDone(result);
  return status;
}

CMPIStatus enumerateInstances(const CMPIBroker* broker, Publish publish, const CMPIResult* result,
                              const CMPIObjectPath* ref, const char** properties) {
  const std::string nameSpace = nameSpaceOf(ref);
  const CMPIStatus status = forEachObject(broker, publish, classNameOf(ref), [&](const HostObject& object) {
    return returnInstance(broker, result, nameSpace, object, properties);
  });
  if (status.rc == CMPI_RC_OK) result->ft->returnDone(result);
  return status;
}

CMPIStatus getInstance(const CMPIBroker* broker, Publish publish, const CMPIResult* result, const CMPIObjectPath* ref,
                       const char** properties) {
  bool found = false;
  const std::string nameSpace = nameSpaceOf(ref);
  const std::string className = classNameOf(ref);
  const CMPIStatus status = forEachObject(broker, publish, className, [&](const HostObject& object) {
    if (found || !hasKeysOf(object, ref)) return kOk;
    found = true;
    return returnInstance(broker, result, nameSpace, object, properties);
  });
  if (status.rc != CMPI_RC_OK) return status;
  if (!found) return failure(broker, CMPI_RC_ERR_NOT_FOUND, "this host has no " + className + " with these keys");
  result->ft->returnDone(result);
  return kOk;
}

CMPIStatus refuse(const CMPIBroker* broker, const char* operation) {
  return failure(broker, CMPI_RC_ERR_NOT_SUPPORTED,
                 std::string(operation) + " is not supported: the objects are as the host has them");
}

}  // namespace zorva::host
