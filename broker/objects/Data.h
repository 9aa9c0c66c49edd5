#pragma once

// Copies the values that a provider passes into data of our own, in the arena of the object that takes them.

#include <cmpidt.h>

#include "broker/objects/Objects.h"

namespace zorva::broker {

struct PropertyInfo;

/// The type under which data of `type` are kept: both forms of C strings become CMPI_string. CMPI_null if a value of
/// that type cannot be kept.
CMPIType keptType(CMPIType type) noexcept;

/// Copies the argument of a setter. `value` points at the value, except for CMPI_chars, where it is the C string
/// itself. Null means no value, as the type CMPI_null does. Only as many bytes are read as the type has. The objects of
/// another broker are read through their own tables. CMPI_RC_ERR_INVALID_DATA_TYPE for a type that cannot be kept,
/// CMPI_RC_ERR_INVALID_HANDLE for an object of the wrong kind, CMPI_RC_ERR_TYPE_MISMATCH for an array of other elements
/// than `type` says.
CMPIrc importData(Arena& arena, const CMPIValue* value, CMPIType type, CMPIData& data);

/// A copy of data that an object of ours holds. Texts and date-times of the same arena are shared.
CMPIData copyData(Arena& arena, const CMPIData& data);

/// True if data of `type` may be the value of something declared as `declared`. `takesInstance`: it is declared as a
/// text that holds an embedded instance.
bool typeFits(CMPIType declared, bool takesInstance, CMPIType type) noexcept;

/// CMPI_RC_OK if `data` may be the value of `property`. Data without value fit everywhere and take its type.
CMPIrc fitData(const PropertyInfo& property, CMPIData& data) noexcept;

CMPIData nullData(CMPIType type, CMPIValueState state = CMPI_nullValue) noexcept;
CMPIData stringData(StringObject* text) noexcept;

/// Copies of whole objects. An immutable object in the same arena is not copied.
StringObject* copyString(Arena& arena, const StringObject& text);
DateTimeObject* copyDateTime(Arena& arena, const DateTimeObject& dateTime);
ArrayObject* copyArray(Arena& arena, const ArrayObject& array);
PathObject* copyPath(Arena& arena, const PathObject& path);
InstanceObject* copyInstance(Arena& arena, const InstanceObject& instance);
ArgsObject* copyArgs(Arena& arena, const ArgsObject& args);
void copyEntries(Arena& arena, const EntryList& from, EntryList& to);

/// The object of a handle as an object of ours in `arena` (an object of ours is copied as above). Null if the handle is
/// null, has no object, or is of the wrong kind; or if another broker's object cannot be read.
StringObject* adoptString(Arena& arena, const CMPIString* handle);
DateTimeObject* adoptDateTime(Arena& arena, const CMPIDateTime* handle);
ArrayObject* adoptArray(Arena& arena, const CMPIArray* handle);
PathObject* adoptPath(Arena& arena, const CMPIObjectPath* handle);
InstanceObject* adoptInstance(Arena& arena, const CMPIInstance* handle);

/// The path of a handle: without a copy if it is ours, else copied into `arena`. Null as above.
const PathObject* readPath(Arena& arena, const CMPIObjectPath* handle);
const InstanceObject* readInstance(Arena& arena, const CMPIInstance* handle);

/// The text of a handle, ours or another broker's; empty if it has none. Valid as long as the handle's object.
std::string_view textOf(const CMPIString* handle) noexcept;

}  // namespace zorva::broker
