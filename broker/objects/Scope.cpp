#include "broker/objects/Scope.h"

#include <algorithm>
#include <cstdlib>

#include "broker/objects/BlockCache.h"
#include "broker/objects/ClassTable.h"

namespace zorva::broker {

namespace {

// Enough for a request for one instance.
constexpr std::size_t kFirstBlock = 4096;

thread_local Scope* innermost = nullptr;

}  // namespace

Scope::Scope(const ClassTable& classes, BlockCache& blocks)
    : classes_(classes),
      cache_(blocks),
      parent_(innermost),
      depth_(innermost != nullptr ? innermost->depth_ + 1 : 1),
      arena_(&classes, kFirstBlock, &blocks) {
  innermost = this;
}

Scope::~Scope() {
  // A broker that ends closes the scopes of threads that never detached, on its own thread.
  if (innermost == this) innermost = parent_;
}

Scope* Scope::current() noexcept { return innermost; }

bool Scope::isClaimed() const noexcept {
  for (const Scope* scope = this; scope != nullptr; scope = scope->parent_) {
    if (scope->isClaimed_) return true;
  }
  return false;
}

void Scope::share() noexcept {
  arena_.share();
  for (const auto& mark : marks_) mark->share();
}

const void* Scope::mark() {
  marks_.push_back(std::make_unique<Arena>(&classes_, kFirstBlock, &cache_));
  if (arena_.isShared()) marks_.back()->share();
  return marks_.back().get();
}

bool Scope::release(const void* mark) {
  const auto found =
      std::find_if(marks_.begin(), marks_.end(), [mark](const auto& candidate) { return candidate.get() == mark; });
  if (found == marks_.end()) return false;
  marks_.erase(found, marks_.end());
  return true;
}

void Scope::FreeBlock::operator()(void* block) const noexcept { std::free(block); }

void* Scope::allocate(std::size_t size) {
  std::unique_ptr<void, FreeBlock> block(std::malloc(size == 0 ? 1 : size));
  if (block == nullptr) return nullptr;
  void* memory = block.get();
  blocks_.emplace(memory, std::move(block));
  return memory;
}

void* Scope::reallocate(void* block, std::size_t size) {
  auto node = blocks_.extract(block);
  if (node.empty()) return nullptr;
  void* moved = std::realloc(block, size == 0 ? 1 : size);
  if (moved != nullptr) {
    (void)node.mapped().release();
    node.mapped().reset(moved);
    node.key() = moved;
  }
  blocks_.insert(std::move(node));
  return moved;
}

void Scope::free(void* block) { blocks_.erase(block); }

Arena* currentArena(Arena* fallback) noexcept { return innermost != nullptr ? &innermost->arena() : fallback; }

}  // namespace zorva::broker
