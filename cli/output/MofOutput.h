#pragma once

#include <string>

#include "broker/objects/Value.h"

namespace zorva::cli {

/// An instance as MOF (DSP0004), ended by a line feed; a reference is the text of its path.
std::string instanceMof(const broker::Instance& instance);

}  // namespace zorva::cli
