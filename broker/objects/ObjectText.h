#pragma once

#include <string>

#include "broker/objects/Objects.h"

// CMPI objects as text for people: what toString gives.

namespace zorva::broker {

/// A path in the form of PathText.h.
std::string objectText(const PathObject& path);

/// Any object of this broker: an instance in the form of MOF, a text as it stands, an array in braces. Empty where
/// `object` is none of this broker's.
std::string objectText(const void* object);

/// A value as MOF has it: `"a"`, `{1, 2}`, `NULL`.
std::string dataText(const CMPIData& data);

}  // namespace zorva::broker
