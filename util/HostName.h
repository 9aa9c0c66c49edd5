#pragma once

// The name of this host.

#include <string>

namespace zorva::util {

/// What uname(2) says, in the UTS namespace of the calling thread; the empty text where it says nothing. No resolver is
/// asked.
std::string kernelHostName();

}  // namespace zorva::util
