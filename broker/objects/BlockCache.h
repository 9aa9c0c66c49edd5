#pragma once

// Memory blocks that arenas gave back, kept for the next request: memory that was used before costs no page faults.
// Safe on any thread.

#include <cstddef>
#include <mutex>

#include "util/NotCopied.h"

namespace zorva::broker {

/// The head of a block; the usable memory follows it.
struct MemoryBlock {
  MemoryBlock* previous;
  std::size_t size;  ///< of the memory after the head
};

class BlockCache : util::NotCopied {
 public:
  /// The size of the blocks that are kept.
  static constexpr std::size_t kBlock = std::size_t{256} * 1024 - sizeof(MemoryBlock);
  /// How many are kept: an idle server holds no more than this.
  static constexpr std::size_t kMostBlocks = 16;

  BlockCache() = default;
  ~BlockCache();

  /// A block of kBlock bytes, or null where none is kept.
  MemoryBlock* take() noexcept;
  /// True if the block is kept; else the caller still owns it.
  bool keep(MemoryBlock* block) noexcept;

 private:
  std::mutex mutex_;
  MemoryBlock* blocks_ = nullptr;
  std::size_t count_ = 0;
};

}  // namespace zorva::broker
