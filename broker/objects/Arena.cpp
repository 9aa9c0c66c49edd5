#include "broker/objects/Arena.h"

#include <cstdlib>
#include <cstring>

#include "broker/objects/BlockCache.h"

namespace zorva::broker {

Arena::~Arena() {
  while (blocks_ != nullptr) {
    MemoryBlock* block = blocks_;
    blocks_ = block->previous;
    allowUse(block + 1, block->size);
    if (cache_ == nullptr || !cache_->keep(block)) std::free(block);
  }
}

char* Arena::addBlock(std::size_t size) {
  MemoryBlock* block = cache_ != nullptr && size == BlockCache::kBlock ? cache_->take() : nullptr;
  if (block == nullptr) {
    block = static_cast<MemoryBlock*>(std::malloc(sizeof(MemoryBlock) + size));
    if (block == nullptr) throw std::bad_alloc();
    block->size = size;
  }
  block->previous = blocks_;
  blocks_ = block;
  size_ += sizeof(MemoryBlock) + size;
  forbidUse(block + 1, size);
  return reinterpret_cast<char*>(block + 1);
}

void* Arena::takeFromNewBlock(std::size_t size) {
  if (size > kMost) throw std::bad_alloc();
  // A large object gets its own block, so that the room left in the present one is not lost.
  if (size > next_ / 2) {
    char* memory = addBlock(size);
    allowUse(memory, size);
    return memory;
  }
  position_ = addBlock(next_);
  end_ = position_ + next_;
  // Small requests stay small. Later blocks have the size that the cache keeps.
  next_ = next_ * 4 < BlockCache::kBlock ? next_ * 4 : BlockCache::kBlock;
  return take(size);
}

void* Arena::allocateShared(std::size_t size) {
  const std::lock_guard lock(mutex_);
  return take(size);
}

const char* Arena::text(std::string_view text) {
  auto* copy = static_cast<char*>(allocate(text.size() + 1));
  if (!text.empty()) std::memcpy(copy, text.data(), text.size());
  copy[text.size()] = '\0';
  return copy;
}

}  // namespace zorva::broker
