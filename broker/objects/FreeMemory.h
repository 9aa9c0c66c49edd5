#pragma once

// Under AddressSanitizer nobody may touch the memory that an arena has not given out: a write past an object is found
// at once, and not only where it leaves the block. Otherwise these functions do nothing.

#include <cstddef>

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ZORVA_FORBIDS_FREE_MEMORY
#endif
#elif defined(__SANITIZE_ADDRESS__)
#define ZORVA_FORBIDS_FREE_MEMORY
#endif

#ifdef ZORVA_FORBIDS_FREE_MEMORY
#include <sanitizer/asan_interface.h>
#endif

namespace zorva::broker {

inline void forbidUse([[maybe_unused]] const void* memory, [[maybe_unused]] std::size_t size) noexcept {
#ifdef ZORVA_FORBIDS_FREE_MEMORY
  __asan_poison_memory_region(memory, size);
#endif
}

inline void allowUse([[maybe_unused]] const void* memory, [[maybe_unused]] std::size_t size) noexcept {
#ifdef ZORVA_FORBIDS_FREE_MEMORY
  __asan_unpoison_memory_region(memory, size);
#endif
}

}  // namespace zorva::broker
