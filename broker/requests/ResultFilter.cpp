#include "broker/requests/ResultFilter.h"

#include <algorithm>

#include "broker/objects/Data.h"
#include "broker/objects/PathText.h"

namespace zorva::broker {

bool ResultFilter::takeInstance(const InstanceObject& instance) {
  if (!admits(*instance.info)) return true;
  const InstanceObject* named = &instance;
  if (instance.nameSpace->length == 0) {
    InstanceObject* copy = copyInstance(scope_.arena(), instance);
    copy->nameSpace = intern(scope_.arena(), nameSpace_);
    named = copy;
  }
  full_ = !taker_.takeInstance(*named, maskOf(*instance.info));
  return !full_;
}

bool ResultFilter::takePath(const PathObject& path) {
  if (path.info == nullptr) {
    core_.log(LogLevel::Warning, "a provider returned a path of the unknown class " +
                                     quotedText(path.className->view().substr(0, 200)) + "; it was dropped");
    return true;
  }
  if (!admits(*path.info)) return true;
  const PathObject* named = &path;
  if (path.nameSpace->length == 0) {
    PathObject* copy = copyPath(scope_.arena(), path);
    copy->setNameSpace(nameSpace_);
    named = copy;
  }
  full_ = !taker_.takePath(*named);
  return !full_;
}

bool ResultFilter::admits(const ClassInfo& info) {
  if (within != nullptr && &info != within && !info.isA(*within)) {
    logDrop(info, "which is not " + within->name() + " or below it");
    return false;
  }
  if (servedAs == nullptr || &info == servedAs) return true;
  const schema::Class* nearest = &info.declared();
  while (nearest != nullptr && !isServed(*nearest)) nearest = nearest->superclass();
  if (nearest == &servedAs->declared()) return true;
  logDrop(info, "which were not asked for with " + servedAs->name());
  return false;
}

void ResultFilter::logDrop(const ClassInfo& info, std::string_view why) {
  if (std::find(logged_.begin(), logged_.end(), &info) != logged_.end()) return;
  logged_.push_back(&info);
  core_.log(LogLevel::Info,
            "a provider returned objects of " + info.name() + ", " + std::string(why) + "; they were dropped");
}

bool ResultFilter::isServed(const schema::Class& declared) const {
  const ProviderEntry* entry = core_.registry().find(nameSpace_, declared.name());
  return entry != nullptr && (entry->kinds & InstanceMi) != 0;
}

bool ResultFilter::includes(const PropertyInfo& property) const {
  const std::string& name = property.declared->name;
  if (requested_ != nullptr && shape_.localOnly) {
    const schema::Class& origin = *property.declared->origin;
    const bool local = shape_.deepInheritance ? origin.isA(requested_->declared()) : &origin == &requested_->declared();
    if (!local) return false;
  }
  if (requested_ != nullptr && !shape_.deepInheritance && requested_->find(name) == nullptr) return false;
  if (!shape_.properties) return true;
  return std::any_of(shape_.properties->begin(), shape_.properties->end(),
                     [&name](std::string_view listed) { return util::sameName(listed, name); });
}

PropertyMask ResultFilter::maskOf(const ClassInfo& info) {
  if (!shape_.properties && !shape_.localOnly && shape_.deepInheritance) return {};
  for (const auto& [known, bits] : masks_) {
    if (known == &info) return {bits.data()};
  }
  std::vector<std::uint64_t> bits(info.properties().size() / 64 + 1);
  for (const PropertyInfo& property : info.properties()) {
    if (includes(property)) bits[property.index / 64] |= std::uint64_t{1} << (property.index % 64);
  }
  masks_.emplace_back(&info, std::move(bits));
  return {masks_.back().second.data()};
}

}  // namespace zorva::broker
