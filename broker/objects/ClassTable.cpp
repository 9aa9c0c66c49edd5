#include "broker/objects/ClassTable.h"

#include <mutex>

namespace zorva::broker {

namespace {

// Hashes the length and a few characters. That tells nearly all names of one class apart, and is cheap: a look-up is
// made for each property that a provider sets. Other names share a bucket. The bit that makes the difference between
// small letters and capitals is left out.
std::size_t bucketOf(std::string_view name, std::size_t mask) noexcept {
  constexpr std::uint32_t kSmallLetters = 0x20202020;
  if (name.empty()) return 0;
  const auto at = [&](std::size_t place) {
    return static_cast<std::uint32_t>(static_cast<unsigned char>(name[place]));
  };
  const std::size_t size = name.size();
  const std::uint32_t letters = at(0) | at(size / 3) << 8 | at(size / 2) << 16 | at(size - 1) << 24;
  const std::uint32_t hash = ((letters | kSmallLetters) ^ static_cast<std::uint32_t>(size)) * 2654435769U;
  return (hash >> 16) & mask;
}

}  // namespace

ClassInfo::ClassInfo(const schema::Class& declared)
    : declared_(declared), nameObject_(nullptr, declared.name()), successors_(declared.properties().size() + 1) {
  const auto& all = declared.properties();
  properties_.reserve(all.size());
  std::size_t size = 4;
  while (size < all.size() * 2) size *= 2;
  buckets_.resize(size);
  for (const schema::ClassProperty* property : all) {
    names_.emplace_back(nullptr, property->name);
    const auto index = static_cast<std::uint16_t>(properties_.size());
    const bool takesInstance = schema::findQualifier(property->qualifiers, "EmbeddedInstance") != nullptr ||
                               schema::hasQualifier(property->qualifiers, "EmbeddedObject");
    properties_.push_back(
        {property, &names_.back(), cmpiType(property->type, property->isArray), index, property->isKey, takesInstance});
    std::size_t bucket = bucketOf(property->name, size - 1);
    while (buckets_[bucket] != 0) bucket = (bucket + 1) & (size - 1);
    buckets_[bucket] = static_cast<std::uint16_t>(index + 1);
  }
  for (const PropertyInfo& property : properties_) {
    if (property.isKey) keys_.push_back(&property);
  }
}

const PropertyInfo* ClassInfo::find(std::string_view name) const noexcept {
  const std::size_t mask = buckets_.size() - 1;
  for (std::size_t bucket = bucketOf(name, mask); buckets_[bucket] != 0; bucket = (bucket + 1) & mask) {
    const PropertyInfo& property = properties_[buckets_[bucket] - 1U];
    const std::string_view known = property.name->view();
    if (known == name || util::sameName(known, name)) return &property;
  }
  return nullptr;
}

const PropertyInfo* ClassInfo::findAfter(const PropertyInfo* previous, const char* name) const noexcept {
  std::atomic<std::uint16_t>& successor = successors_[previous != nullptr ? previous->index + 1U : 0];
  if (const std::uint16_t usual = successor.load(std::memory_order_relaxed); usual != 0) {
    const PropertyInfo& property = properties_[usual - 1U];
    if (property.declared->name == name) return &property;
  }
  const PropertyInfo* found = find(name);
  if (found != nullptr) successor.store(static_cast<std::uint16_t>(found->index + 1), std::memory_order_relaxed);
  return found;
}

ClassTable::ClassTable(std::shared_ptr<const schema::ClassRepository> repository)
    : repository_(std::move(repository)) {}

const ClassInfo* ClassTable::find(std::string_view name) const {
  {
    const std::shared_lock lock(mutex_);
    const auto found = classes_.find(name);
    if (found != classes_.end()) return found->second.get();
  }
  const schema::Class* declared = repository_->find(name);
  if (declared == nullptr) return nullptr;
  auto made = std::make_unique<ClassInfo>(*declared);
  const std::unique_lock lock(mutex_);
  // If another thread was faster, its object stays: callers hold pointers to it.
  return classes_.try_emplace(declared->name(), std::move(made)).first->second.get();
}

const ClassInfo* findClass(Arena& arena, std::string_view name) {
  if (arena.classes() == nullptr) return nullptr;
  if (arena.isShared()) return arena.classes()->find(name);
  RecentNames& recent = arena.recent();
  for (const ClassInfo* known : recent.classes) {
    if (known != nullptr && util::sameName(known->name(), name)) return known;
  }
  const ClassInfo* found = arena.classes()->find(name);
  if (found != nullptr) recent.classes[recent.nextClass++ % RecentNames::kRemembered] = found;
  return found;
}

CMPIType cmpiType(schema::Type type, bool isArray) noexcept {
  CMPIType simple = CMPI_string;
  switch (type) {
    case schema::Type::Boolean:
      simple = CMPI_boolean;
      break;
    case schema::Type::String:
      simple = CMPI_string;
      break;
    case schema::Type::DateTime:
      simple = CMPI_dateTime;
      break;
    case schema::Type::Char16:
      simple = CMPI_char16;
      break;
    case schema::Type::Uint8:
      simple = CMPI_uint8;
      break;
    case schema::Type::Sint8:
      simple = CMPI_sint8;
      break;
    case schema::Type::Uint16:
      simple = CMPI_uint16;
      break;
    case schema::Type::Sint16:
      simple = CMPI_sint16;
      break;
    case schema::Type::Uint32:
      simple = CMPI_uint32;
      break;
    case schema::Type::Sint32:
      simple = CMPI_sint32;
      break;
    case schema::Type::Uint64:
      simple = CMPI_uint64;
      break;
    case schema::Type::Sint64:
      simple = CMPI_sint64;
      break;
    case schema::Type::Real32:
      simple = CMPI_real32;
      break;
    case schema::Type::Real64:
      simple = CMPI_real64;
      break;
    case schema::Type::Reference:
      simple = CMPI_ref;
      break;
  }
  return static_cast<CMPIType>(isArray ? simple | CMPI_ARRAY : simple);
}

}  // namespace zorva::broker
