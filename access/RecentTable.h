#pragma once

// A bounded table that forgets what was put into it first.

#include <cstddef>
#include <list>
#include <unordered_map>
#include <utility>

namespace zorva::access {

template <typename Key, typename Value>
class RecentTable {
 public:
  explicit RecentTable(std::size_t most) : most_(most) {}

  /// Null if there is none. Valid until the next put() or eraseIf().
  Value* find(const Key& key) {
    const auto found = places_.find(key);
    return found == places_.end() ? nullptr : &found->second->second;
  }

  /// Puts it last, in place of the one with the same key. If the table is full, the first one goes.
  Value& put(const Key& key, Value value) {
    const auto found = places_.find(key);
    if (found != places_.end()) {
      entries_.splice(entries_.end(), entries_, found->second);
      return entries_.back().second = std::move(value);
    }
    if (entries_.size() >= most_) {
      places_.erase(entries_.front().first);
      entries_.pop_front();
    }
    entries_.emplace_back(key, std::move(value));
    places_[key] = std::prev(entries_.end());
    return entries_.back().second;
  }

  template <typename Predicate>
  void eraseIf(Predicate&& isMeant) {
    entries_.remove_if([&](const auto& entry) {
      const bool goes = isMeant(entry.second);
      if (goes) places_.erase(entry.first);
      return goes;
    });
  }

  std::size_t size() const noexcept { return entries_.size(); }

 private:
  using Entries = std::list<std::pair<Key, Value>>;
  const std::size_t most_;
  Entries entries_;
  std::unordered_map<Key, typename Entries::iterator> places_;
};

}  // namespace zorva::access
