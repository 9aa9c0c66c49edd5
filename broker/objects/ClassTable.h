#pragma once

// The schema as the broker's objects need it: names as CMPI texts, types as CMPI types, and fast look-ups. A class is
// converted at its first look-up.

#include <atomic>
#include <cstdint>
#include <deque>
#include <memory>
#include <shared_mutex>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "broker/objects/Objects.h"
#include "schema/ClassRepository.h"
#include "util/NotCopied.h"

namespace zorva::broker {

/// A class as the broker's objects see it. Immutable, except for statistics of its use.
class ClassInfo : util::NotCopied {
 public:
  explicit ClassInfo(const schema::Class& declared);

  const schema::Class& declared() const noexcept { return declared_; }
  const std::string& name() const noexcept { return declared_.name(); }
  StringObject* nameObject() const noexcept { return const_cast<StringObject*>(&nameObject_); }
  const std::vector<PropertyInfo>& properties() const noexcept { return properties_; }
  const std::vector<const PropertyInfo*>& keys() const noexcept { return keys_; }

  /// Null if the class has no such property; the name in any case.
  const PropertyInfo* find(std::string_view name) const noexcept;

  /// The same, faster if `name` is the property that followed `previous` the last time: a provider sets the properties
  /// of all its instances in one order. A null `previous` is the position before the first.
  const PropertyInfo* findAfter(const PropertyInfo* previous, const char* name) const noexcept;

  /// The same, faster if `name` is the class's key with that number.
  const PropertyInfo* findKey(std::size_t number, std::string_view name) const noexcept {
    const bool isUsual = number < keys_.size() && keys_[number]->name->view() == name;
    return isUsual ? keys_[number] : find(name);
  }

  /// How many properties the fullest instance so far had: a new instance reserves that much room.
  std::uint32_t usualSize() const noexcept { return usualSize_.load(std::memory_order_relaxed); }
  void noteSize(std::uint32_t size) const noexcept {
    if (size > usualSize()) usualSize_.store(size, std::memory_order_relaxed);
  }

  bool isA(const ClassInfo& ancestor) const noexcept { return declared_.isA(ancestor.declared_); }

 private:
  const schema::Class& declared_;
  StringObject nameObject_;
  std::deque<StringObject> names_;  ///< a deque: other objects point at the elements
  std::vector<PropertyInfo> properties_;
  std::vector<const PropertyInfo*> keys_;
  /// Open addressing: index + 1 of the property whose name hashes here, 0 for none. At most half full.
  std::vector<std::uint16_t> buckets_;
  mutable std::atomic<std::uint32_t> usualSize_ = 0;
  /// Index + 1 of the property that came after each one (0: before the first) the last time; 0 for none.
  mutable std::vector<std::atomic<std::uint16_t>> successors_;
};

/// All classes of a broker. Safe on any thread.
class ClassTable {
 public:
  explicit ClassTable(std::shared_ptr<const schema::ClassRepository> repository);

  const schema::ClassRepository& repository() const noexcept { return *repository_; }

  /// Null if the schema has no such class; the name in any case. The result lives as long as the table.
  const ClassInfo* find(std::string_view name) const;
  const ClassInfo& of(const schema::Class& declared) const { return *find(declared.name()); }

 private:
  const std::shared_ptr<const schema::ClassRepository> repository_;
  mutable std::shared_mutex mutex_;
  mutable std::unordered_map<std::string_view, std::unique_ptr<ClassInfo>, util::NameHash, util::NameEqual> classes_;
};

/// The class of that name in the class table of `arena`, or null. Recently used classes are found fastest.
const ClassInfo* findClass(Arena& arena, std::string_view name);

/// The CMPI type of a schema's type.
CMPIType cmpiType(schema::Type type, bool isArray) noexcept;

}  // namespace zorva::broker
