#include "broker/requests/Modification.h"

#include <algorithm>
#include <string>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Convert.h"
#include "broker/objects/Data.h"
#include "broker/objects/PathText.h"
#include "util/Names.h"

namespace zorva::broker {

namespace {

std::string quoted(std::string_view name) { return quotedText(name.substr(0, 200)); }

Value valueOf(const CMPIData& data) {
  Value value;
  fillValue(data, value);
  return value;
}

bool holds(const PathObject& path, const PropertyInfo& key, const Value& value) {
  const EntryList::Entry* entry = path.keys.find(key.name->view());
  return entry != nullptr && valueOf(entry->data) == value;
}

bool holds(const InstanceObject* instance, const PropertyInfo& property, const Value& value) {
  const InstanceObject::Slot* slot = instance != nullptr ? instance->find(property) : nullptr;
  return hasSameEffect(value, slot != nullptr ? valueOf(slot->data) : Value::null(value.type, value.isArray));
}

Status checkListedNames(const ModificationRequest& request) {
  if (!request.shape.properties) return {};
  const ClassInfo& info = *request.given.info;
  for (const std::string_view name : *request.shape.properties) {
    if (info.find(name) != nullptr) continue;
    return {CMPI_RC_ERR_INVALID_PARAMETER, "PropertyList: " + info.name() + " has no property " + quoted(name)};
  }
  return {};
}

/// A key may be repeated with the value of the path or, if the provider accepts other paths too, with its own value.
Status checkKeys(const ModificationRequest& request) {
  for (const PropertyInfo* key : request.given.info->keys()) {
    const InstanceObject::Slot* slot = request.given.find(*key);
    if (slot == nullptr || slot->data.state != CMPI_goodValue) continue;
    const Value value = valueOf(slot->data);
    if (holds(request.path, *key, value) || holds(request.current, *key, value)) continue;
    return {CMPI_RC_ERR_INVALID_PARAMETER,
            "the key " + key->declared->name + " of the instance is not that of its name; a key cannot be changed"};
  }
  return {};
}

bool isListed(const Shape& shape, const PropertyInfo& property) {
  if (!shape.properties) return true;
  return std::any_of(shape.properties->begin(), shape.properties->end(),
                     [&](std::string_view name) { return util::sameName(name, property.name->view()); });
}

/// The value that the client names for the property, if it is not the current one; else null.
const CMPIData* newValue(const ModificationRequest& request, const PropertyInfo& property) {
  const InstanceObject::Slot* slot = request.given.find(property);
  if (property.isKey || slot == nullptr || !isListed(request.shape, property)) return nullptr;
  if (request.current != nullptr && holds(request.current, property, valueOf(slot->data))) return nullptr;
  return &slot->data;
}

bool isKept(const ProviderEntry& provider, const PropertyInfo& property) {
  return std::any_of(provider.keeps.begin(), provider.keeps.end(),
                     [&](const std::string& name) { return util::sameName(name, property.name->view()); });
}

void handOver(const ModificationRequest& request, const PropertyInfo& property, Modification& modification) {
  InstanceObject& handed = *modification.handed;
  if (const CMPIData* data = newValue(request, property)) {
    modification.changed.push_back(&property);
    handed.set(property, copyData(*handed.arena, *data));
    return;
  }
  if (request.current == nullptr || handed.find(property) != nullptr || isKept(request.provider, property)) return;
  const InstanceObject::Slot* slot = request.current->find(property);
  if (slot != nullptr && slot->data.state == CMPI_goodValue) handed.set(property, copyData(*handed.arena, slot->data));
}

/// If the current values are not known, the provider must check the properties that cannot be changed.
Status checkWritable(const ModificationRequest& request, const Modification& modification) {
  if (request.current == nullptr) return {};
  std::string names;
  for (const PropertyInfo* property : modification.changed) {
    if (schema::hasQualifier(property->declared->qualifiers, "Write")) continue;
    names += (names.empty() ? "" : ", ") + property->declared->name;
  }
  if (names.empty()) return {};
  return {CMPI_RC_ERR_NOT_SUPPORTED,
          "these properties of " + request.given.info->name() + " cannot be changed: " + names};
}

}  // namespace

Status planModification(Arena& arena, const ModificationRequest& request, Modification& modification) {
  if (request.given.info != request.path.info) {
    return {CMPI_RC_ERR_INVALID_PARAMETER, "the instance is of the class " + request.given.info->name() +
                                               ", its name of the class " + request.path.info->name()};
  }
  Status status = checkListedNames(request);
  if (status.ok()) status = checkKeys(request);
  if (!status.ok()) return status;
  modification.handed = InstanceObject::make(arena, request.path);
  for (const PropertyInfo& property : request.path.info->properties()) handOver(request, property, modification);
  return checkWritable(request, modification);
}

}  // namespace zorva::broker
