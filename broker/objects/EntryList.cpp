#include <algorithm>

#include "broker/objects/Objects.h"
#include "util/Names.h"

namespace zorva::broker {

const EntryList::Entry* EntryList::find(std::string_view name) const noexcept {
  const Entry* found =
      std::find_if(begin(), end(), [name](const Entry& entry) { return util::sameName(entry.name->view(), name); });
  return found != end() ? found : nullptr;
}

void EntryList::share(const EntryList& other) noexcept {
  *this = other;
  shared_ = other.shared_ = true;
}

void EntryList::set(Arena& arena, StringObject* name, const CMPIData& data) {
  if (const Entry* known = find(name->view())) {
    const auto index = known - entries_;
    if (shared_) moveTo(arena, size_);
    entries_[index].data = data;
  } else {
    append(arena, name, data);
  }
}

void EntryList::append(Arena& arena, StringObject* name, const CMPIData& data) {
  if (size_ == capacity_) {
    moveTo(arena, capacity_ == 0 ? 4 : capacity_ * 2);
  } else if (shared_) {
    moveTo(arena, capacity_);
  }
  entries_[size_++] = {name, data};
}

void EntryList::reserve(Arena& arena, std::uint32_t capacity) {
  if (capacity > capacity_) moveTo(arena, capacity);
}

void EntryList::moveTo(Arena& arena, std::uint32_t capacity) {
  auto* grown = arena.makeArray<Entry>(capacity);
  std::copy(begin(), end(), grown);
  entries_ = grown;
  capacity_ = capacity;
  shared_ = false;
}

}  // namespace zorva::broker
