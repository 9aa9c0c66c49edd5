#pragma once

// The name of this host.

#include <string>

namespace zorva::util {

/// The node name of uname(2), in the UTS namespace of the calling thread; the empty text if there is none. No resolver
/// is asked.
std::string kernelHostName();

}  // namespace zorva::util
