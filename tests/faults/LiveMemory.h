#pragma once

// The memory and the files that the program holds, to show that nothing is left over.

#include <cstddef>

namespace ZV::Test {

/// How many blocks of operator new are not freed, in the whole program.
long liveBlocks();

/// How many file descriptors are open.
std::size_t openFiles();

}  // namespace ZV::Test
