#pragma once

#include <string>

namespace ZV {

/// The log category of the object functions.
extern const std::string loggerDNSObjFactory;

}  // namespace ZV
