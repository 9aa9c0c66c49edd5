#include "broker/objects/BlockCache.h"

#include <cstdlib>

namespace zorva::broker {

BlockCache::~BlockCache() {
  while (MemoryBlock* block = take()) std::free(block);
}

MemoryBlock* BlockCache::take() noexcept {
  const std::lock_guard lock(mutex_);
  MemoryBlock* block = blocks_;
  if (block == nullptr) return nullptr;
  blocks_ = block->previous;
  --count_;
  return block;
}

bool BlockCache::keep(MemoryBlock* block) noexcept {
  if (block->size != kBlock) return false;
  const std::lock_guard lock(mutex_);
  if (count_ == kMostBlocks) return false;
  block->previous = blocks_;
  blocks_ = block;
  ++count_;
  return true;
}

}  // namespace zorva::broker
