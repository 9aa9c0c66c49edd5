#pragma once

// The memory of one request on one thread: the arena in which its CMPI objects are made, and the memory that its
// providers allocated. Scopes nest as requests do: an up-call opens one within its caller's. Objects are made in the
// innermost scope of a thread.

#include <cmpidt.h>

#include <atomic>
#include <cstddef>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "broker/objects/Arena.h"
#include "util/NotCopied.h"

namespace zorva::broker {

class BlockCache;
class ClassTable;

class Scope : util::NotCopied {
 public:
  /// Opens a scope on this thread, for objects of these classes. It must be closed on the same thread, inner scopes
  /// first. `blocks` gives the memory.
  Scope(const ClassTable& classes, BlockCache& blocks);
  ~Scope();

  /// The innermost scope of this thread, or null.
  static Scope* current() noexcept;

  Scope* parent() const noexcept { return parent_; }
  unsigned depth() const noexcept { return depth_; }

  /// Whether this request, or an outer one, holds a claim. Nested requests may read and set it on any thread.
  bool isClaimed() const noexcept;
  void setClaimed(bool isClaimed) noexcept { isClaimed_ = isClaimed; }

  /// Where objects are made now: the arena of the latest mark, or the scope's own.
  Arena& arena() noexcept { return marks_.empty() ? arena_ : *marks_.back(); }

  /// Makes all arenas of the scope safe for the threads that a provider is about to attach.
  void share() noexcept;

  /// Objects that are made from now on are freed by release(mark), or with the scope.
  const void* mark();
  /// False if `mark` is not of this scope. Later marks are released too.
  bool release(const void* mark);

  /// Memory that is freed with the scope. Null if out of memory, like malloc.
  void* allocate(std::size_t size);
  /// Null, with the block unchanged, if `block` is not of this scope.
  void* reallocate(void* block, std::size_t size);
  /// Ignores a block that is not of this scope.
  void free(void* block);

 private:
  struct FreeBlock {
    void operator()(void* block) const noexcept;
  };

  const ClassTable& classes_;
  BlockCache& cache_;
  Scope* const parent_;
  const unsigned depth_;
  std::atomic<bool> isClaimed_ = false;
  Arena arena_;
  std::vector<std::unique_ptr<Arena>> marks_;
  std::unordered_map<void*, std::unique_ptr<void, FreeBlock>> blocks_;
};

/// The arena of the innermost scope; `fallback` on a thread that has none.
Arena* currentArena(Arena* fallback = nullptr) noexcept;

}  // namespace zorva::broker
