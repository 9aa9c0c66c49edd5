#pragma once

// The qualifiers of the schema, as CMPI hands them out by the path of a class.

#include "broker/objects/Objects.h"
#include "schema/ClassRepository.h"

namespace zorva::broker {

/// The qualifiers of the named element; null if the class of the path or the element does not exist. A name may be
/// null.
const schema::Qualifiers* classQualifiers(const PathObject& path) noexcept;
const schema::Qualifiers* propertyQualifiers(const PathObject& path, const char* property) noexcept;
const schema::Qualifiers* methodQualifiers(const PathObject& path, const char* method) noexcept;
const schema::Qualifiers* parameterQualifiers(const PathObject& path, const char* method,
                                              const char* parameter) noexcept;

/// The value of one of them, made in the current scope. CMPI_RC_ERR_NOT_FOUND if `qualifiers` is null or has none of
/// that name.
CMPIData qualifierData(const PathObject& path, const schema::Qualifiers* qualifiers, const char* name,
                       CMPIStatus* status);

}  // namespace zorva::broker
