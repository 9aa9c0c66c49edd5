// What the program holds of memory and of files, to show that nothing stays behind.
#pragma once

#include <cstddef>

namespace ZV::Test {

// How many blocks of operator new have not been given back, in the whole program.
long liveBlocks();

// How many file descriptors are open.
std::size_t openFiles();

}  // namespace ZV::Test
