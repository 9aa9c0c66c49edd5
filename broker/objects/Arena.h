#pragma once

// The memory of one request. Allocation moves a pointer; all memory is freed at once, with the arena. Objects in it
// have no destructor.
//
// An arena belongs to one thread at a time. share() makes allocation safe for several threads, at the cost of a lock
// each time.

#include <cstddef>
#include <mutex>
#include <new>
#include <string_view>
#include <type_traits>
#include <utility>

#include "broker/objects/FreeMemory.h"
#include "util/NotCopied.h"

namespace zorva::broker {

class BlockCache;
class ClassInfo;
class ClassTable;
struct MemoryBlock;
struct StringObject;

/// The last few classes and texts that were looked up: an operation makes many objects of few classes, and namespaces,
/// hosts and names repeat.
struct RecentNames {
  static constexpr unsigned kRemembered = 4;
  const ClassInfo* classes[kRemembered] = {};
  StringObject* texts[kRemembered] = {};
  unsigned nextClass = 0;
  unsigned nextText = 0;
};

class Arena : util::NotCopied {
 public:
  /// Objects in this arena look up their class in `classes`, which outlives the arena. It may be null if the arena will
  /// hold neither a path nor an instance. The first block of memory has `firstBlock` bytes, later ones are larger. The
  /// largest blocks come from `cache` and go back to it, if there is one.
  explicit Arena(const ClassTable* classes, std::size_t firstBlock = 4096, BlockCache* cache = nullptr)
      : classes_(classes), cache_(cache), next_(firstBlock) {}
  ~Arena();

  const ClassTable* classes() const noexcept { return classes_; }

  /// Memory aligned for pointers and 64-bit numbers. Throws std::bad_alloc.
  void* allocate(std::size_t size) {
    if (shared_) return allocateShared(size);
    return take(size);
  }

  template <typename T, typename... Args>
  T* make(Args&&... args) {
    static_assert(std::is_trivially_destructible_v<T> && alignof(T) <= kAlignment);
    return new (allocate(sizeof(T))) T(std::forward<Args>(args)...);
  }

  /// `count` values of T, value-initialised; at least one, so that the result has an address of its own.
  template <typename T>
  T* makeArray(std::size_t count) {
    static_assert(std::is_trivially_destructible_v<T> && alignof(T) <= kAlignment);
    if (count > kMost / sizeof(T)) throw std::bad_alloc();
    if (count == 0) count = 1;
    return new (allocate(count * sizeof(T))) T[count]();
  }

  /// A copy of `text`, ended by a NUL.
  const char* text(std::string_view text);

  /// From now on several threads may allocate. Call it before the second thread can use the arena.
  void share() noexcept { shared_ = true; }
  bool isShared() const noexcept { return shared_; }

  /// An arena made by clone() holds one object and its parts, and is deleted by that object's release(). Null for the
  /// arena of a request.
  const void* root() const noexcept { return root_; }
  void setRoot(const void* root) noexcept { root_ = root; }

  /// What findClass() and intern() remember for this arena.
  RecentNames& recent() noexcept { return recent_; }

  /// Bytes of memory held.
  std::size_t size() const noexcept { return size_; }

 private:
  static constexpr std::size_t kAlignment = 8;
  /// No object of a request is larger: a larger size is an error of the caller.
  static constexpr std::size_t kMost = static_cast<std::size_t>(1) << 30;

  void* take(std::size_t size) {
    const std::size_t rounded = (size + kAlignment - 1) & ~(kAlignment - 1);
    if (rounded > static_cast<std::size_t>(end_ - position_)) return takeFromNewBlock(size);
    void* memory = position_;
    position_ += rounded;
    allowUse(memory, size);
    return memory;
  }
  void* takeFromNewBlock(std::size_t size);
  void* allocateShared(std::size_t size);
  char* addBlock(std::size_t size);

  const ClassTable* classes_;
  BlockCache* cache_;
  std::size_t next_;  ///< of the next block
  char* position_ = nullptr;
  char* end_ = nullptr;
  MemoryBlock* blocks_ = nullptr;
  std::size_t size_ = 0;
  const void* root_ = nullptr;
  bool shared_ = false;
  std::mutex mutex_;
  RecentNames recent_;
};

}  // namespace zorva::broker
