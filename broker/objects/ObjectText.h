#pragma once

// CMPI objects as text for people: the result of toString.

#include <string>

#include "broker/objects/Objects.h"

namespace zorva::broker {

/// A path in the form of PathText.h.
std::string objectText(const PathObject& path);

/// Any object of this broker: an instance in the form of MOF, a text unchanged, an array in braces. Empty if `object`
/// belongs to another broker.
std::string objectText(const void* object);

/// A value as in MOF: `"a"`, `{1, 2}`, `NULL`.
std::string dataText(const CMPIData& data);

}  // namespace zorva::broker
