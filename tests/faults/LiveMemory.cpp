#include "LiveMemory.h"

#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <new>

namespace {

std::atomic<long> blocks{0};

void* allocate(std::size_t size, std::size_t alignment) {
  // aligned_alloc needs a multiple of the alignment
  void* const block = alignment == 0 ? std::malloc(size == 0 ? 1 : size)
                                     : std::aligned_alloc(alignment, (size + alignment) / alignment * alignment);
  if (block == nullptr) throw std::bad_alloc();
  blocks.fetch_add(1, std::memory_order_relaxed);
  return block;
}

void release(void* block) {
  if (block == nullptr) return;
  blocks.fetch_sub(1, std::memory_order_relaxed);
  std::free(block);
}

}  // namespace

// All other forms in the library call these.
void* operator new(std::size_t size) { return allocate(size, 0); }
void* operator new[](std::size_t size) { return allocate(size, 0); }
void* operator new(std::size_t size, std::align_val_t alignment) {
  return allocate(size, static_cast<std::size_t>(alignment));
}
void* operator new[](std::size_t size, std::align_val_t alignment) {
  return allocate(size, static_cast<std::size_t>(alignment));
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  try {
    return allocate(size, 0);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}
void* operator new[](std::size_t size, const std::nothrow_t& none) noexcept { return operator new(size, none); }
void operator delete(void* block) noexcept { release(block); }
void operator delete[](void* block) noexcept { release(block); }
void operator delete(void* block, std::size_t) noexcept { release(block); }
void operator delete[](void* block, std::size_t) noexcept { release(block); }
void operator delete(void* block, std::align_val_t) noexcept { release(block); }
void operator delete[](void* block, std::align_val_t) noexcept { release(block); }
void operator delete(void* block, std::size_t, std::align_val_t) noexcept { release(block); }
void operator delete[](void* block, std::size_t, std::align_val_t) noexcept { release(block); }
void operator delete(void* block, const std::nothrow_t&) noexcept { release(block); }
void operator delete[](void* block, const std::nothrow_t&) noexcept { release(block); }

namespace ZV::Test {

long liveBlocks() { return blocks.load(std::memory_order_relaxed); }

std::size_t openFiles() {
  const std::filesystem::directory_iterator files("/proc/self/fd");
  return static_cast<std::size_t>(std::distance(begin(files), end(files)));
}

}  // namespace ZV::Test
