// Sets a property of a setting data instance from the getter of its cursor, if a request wants it and the getter has
// it.
#pragma once

#include <string>

#include "factory/CmpiSupport.h"

namespace ZV {

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

}  // namespace ZV
