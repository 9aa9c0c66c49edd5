#pragma once

// Converts between the plain values of clients and the CMPI objects of providers.
//
// The functions that fill a plain value reuse its memory: filling the same value again and again allocates almost
// nothing.

#include <string_view>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Value.h"

namespace zorva::broker {

/// Which properties of a class are requested, by PropertyInfo::index. Without bits: all.
struct PropertyMask {
  const std::uint64_t* bits = nullptr;

  bool has(const PropertyInfo& property) const noexcept {
    return bits == nullptr || (bits[property.index / 64] >> (property.index % 64) & 1U) != 0;
  }
};

void fillPath(const PathObject& object, ObjectPath& path);
/// The properties that are set, in the order in which they were set, then all others of the class without value. The
/// schema's defaults are not used, because they are not facts about the host.
void fillInstance(const InstanceObject& object, const PropertyMask& wanted, Instance& instance);
void fillValue(const CMPIData& data, Value& value);

/// The type of a property, key or parameter as the schema declares it.
struct DeclaredType {
  schema::Type type = schema::Type::String;
  bool isArray = false;
  bool takesInstance = false;
};
DeclaredType declaredType(const PropertyInfo& property) noexcept;
DeclaredType declaredType(const schema::Parameter& parameter) noexcept;

/// Makes data of the declared type, in `arena`. If a number, a boolean or a reference is declared, a text is converted.
/// On a failure, CMPI_RC_ERR_TYPE_MISMATCH, the message names the place `what`.
Status makeData(Arena& arena, const DeclaredType& declared, const Value& value, std::string_view what, CMPIData& data);

/// Data of the value's own type, for properties and parameters that the schema does not know.
Status makeData(Arena& arena, const Value& value, std::string_view what, CMPIData& data);

/// Makes a path whose names are in the schema's spelling and whose keys have the schema's types and order. If the
/// schema lacks the class, the result is CMPI_RC_ERR_INVALID_CLASS where `classMustExist`; otherwise the keys are taken
/// unchanged. A key that the class lacks, or whose value does not fit, is CMPI_RC_ERR_INVALID_PARAMETER. The namespace
/// is taken unchanged.
Status makePath(Arena& arena, const ObjectPath& path, bool classMustExist, PathObject*& object);

/// Makes an instance with the properties of `instance` and the keys of its path.
Status makeInstance(Arena& arena, const PathObject& path, const Instance& instance, InstanceObject*& object);

/// The schema's type for a simple CMPI type.
schema::Type schemaType(CMPIType type) noexcept;

}  // namespace zorva::broker
