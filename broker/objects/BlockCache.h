#pragma once

#include <cstddef>
#include <mutex>

// Memory blocks that arenas gave back, kept for the next request: memory that was touched already costs no page faults.
// Safe on any thread.

namespace zorva::broker {

/// The head of a block; what is handed out follows it.
struct MemoryBlock {
  MemoryBlock* previous;
  std::size_t size;  ///< of what follows
};

class BlockCache {
 public:
  /// The size of the blocks that are kept.
  static constexpr std::size_t kBlock = std::size_t{256} * 1024 - sizeof(MemoryBlock);
  /// How many are kept. A server that has rested holds no more than this.
  static constexpr std::size_t kMostBlocks = 16;

  BlockCache() = default;
  ~BlockCache();
  BlockCache(const BlockCache&) = delete;
  BlockCache& operator=(const BlockCache&) = delete;

  /// A block of kBlock bytes, or null where none is kept.
  MemoryBlock* take() noexcept;
  /// True where the block is kept; else it is still the caller's.
  bool keep(MemoryBlock* block) noexcept;

 private:
  std::mutex mutex_;
  MemoryBlock* blocks_ = nullptr;
  std::size_t count_ = 0;
};

}  // namespace zorva::broker
