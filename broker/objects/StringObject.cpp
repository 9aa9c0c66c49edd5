#include <cstring>
#include <new>

#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

StringObject* copyOfString(Arena& arena, const StringObject& text) { return StringObject::make(arena, text.view()); }

const char* getCharPtr(const CMPIString* handle, CMPIStatus* status) {
  return readFrom<const char*>(own<StringObject>(handle), status, &StringObject::chars);
}

}  // namespace

CMPIStringFT StringObject::table = objectTable<StringObject, copyOfString, getCharPtr>();

StringObject* StringObject::make(Arena& arena, std::string_view text) {
  // Object and characters are one piece of memory.
  auto* memory = static_cast<char*>(arena.allocate(sizeof(StringObject) + text.size() + 1));
  char* chars = memory + sizeof(StringObject);
  if (!text.empty()) std::memcpy(chars, text.data(), text.size());
  chars[text.size()] = '\0';
  return new (memory) StringObject(&arena, std::string_view(chars, text.size()));
}

StringObject& emptyString() noexcept {
  static StringObject empty(nullptr, "");
  return empty;
}

CMPIStatus statusOf(CMPIrc rc, std::string_view message) noexcept {
  CMPIStatus status{rc, nullptr};
  Arena* arena = message.empty() ? nullptr : currentArena();
  if (arena == nullptr) return status;
  try {
    status.msg = StringObject::make(*arena, message);
  } catch (const std::bad_alloc&) {
    // Without memory for the message the code alone is returned.
  }
  return status;
}

StringObject* intern(Arena& arena, std::string_view text) {
  if (text.empty()) return &emptyString();
  if (arena.isShared()) return StringObject::make(arena, text);
  RecentNames& recent = arena.recent();
  for (StringObject* known : recent.texts) {
    if (known != nullptr && known->view() == text) return known;
  }
  StringObject* made = StringObject::make(arena, text);
  recent.texts[recent.nextText++ % RecentNames::kRemembered] = made;
  return made;
}

}  // namespace zorva::broker
