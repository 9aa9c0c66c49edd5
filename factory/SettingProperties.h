#pragma once

// Sets properties of instances: those of setting data, from the getter of the cursor if the request includes them and
// the getter has a value; and arrays.

#include <string>
#include <vector>

#include "factory/CmpiSupport.h"
#include "factory/FactoryLog.h"
#include "trace/Trace.h"

namespace ZV {

inline constexpr const char* kSettingKeys[] = {"InstanceID", nullptr};

template <typename Cursor>
void setTextIfWanted(const CMPIInstance* instance, const WantedProperties& wanted, const char* name, Cursor& cursor,
                     bool (Cursor::*getter)(std::string&)) {
  std::string value;
  if (wanted(name) && (cursor.*getter)(value)) setText(instance, name, value);
}

template <typename Cursor>
void setUint16IfWanted(const CMPIInstance* instance, const WantedProperties& wanted, const char* name, Cursor& cursor,
                       bool (Cursor::*getter)(unsigned short&)) {
  unsigned short value = 0;
  if (wanted(name) && (cursor.*getter)(value)) setUint16(instance, name, value);
}

template <typename Cursor>
void setBooleanIfWanted(const CMPIInstance* instance, const WantedProperties& wanted, const char* name, Cursor& cursor,
                        bool (Cursor::*getter)(bool&)) {
  bool value = false;
  if (wanted(name) && (cursor.*getter)(value)) setBoolean(instance, name, value);
}

/// Null, with an error, if the broker makes none.
inline CMPIArray* newPropertyArray(const CMPIBroker* broker, const std::string& property, CMPICount size,
                                   CMPIType elementType, const LogSite& site, CMPIStatus* status) {
  CMPIArray* array = newArray(broker, size, elementType, status);
  if (array == nullptr) {
    logError(loggerDNSObjFactory, site, ("Create Array for Property " + property + " failed.").c_str());
  }
  return array;
}

/// Sets an array property; setElement(array, i) fills each element. False, with an error, if the broker makes no array.
template <typename Element, typename SetElement>
bool setElements(const CMPIBroker* broker, const CMPIInstance* instance, const char* property, CMPIType elementType,
                 const std::vector<Element>& elements, const LogSite& site, CMPIStatus* status, SetElement setElement) {
  CMPIArray* array = newPropertyArray(broker, property, count16(elements), elementType, site, status);
  if (array == nullptr) return false;
  for (unsigned short i = 0; i < count16(elements); ++i) setElement(array, i);
  setArray(instance, property, array, static_cast<CMPIType>(elementType | CMPI_ARRAY));
  return true;
}

}  // namespace ZV
