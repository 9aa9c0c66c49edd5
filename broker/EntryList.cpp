#include <algorithm>

#include "broker/Objects.h"
#include "schema/Names.h"

namespace zorva::broker {

const EntryList::Entry* EntryList::find(std::string_view name) const noexcept {
  const Entry* found =
      std::find_if(begin(), end(), [name](const Entry& entry) { return schema::sameName(entry.name->view(), name); });
  return found != end() ? found : nullptr;
}

void EntryList::set(Arena& arena, StringObject* name, const CMPIData& data) {
  if (const Entry* known = find(name->view())) {
    entries_[known - entries_].data = data;
  } else {
    append(arena, name, data);
  }
}

void EntryList::append(Arena& arena, StringObject* name, const CMPIData& data) {
  if (size_ == capacity_) reserve(arena, capacity_ == 0 ? 4 : capacity_ * 2);
  entries_[size_++] = {name, data};
}

void EntryList::reserve(Arena& arena, std::uint32_t capacity) {
  if (capacity <= capacity_) return;
  auto* grown = arena.makeArray<Entry>(capacity);
  std::copy(begin(), end(), grown);
  entries_ = grown;
  capacity_ = capacity;
}

}  // namespace zorva::broker
