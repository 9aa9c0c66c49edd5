#include "cimxml/ObjectWriter.h"

#include <algorithm>
#include <string_view>

#include "broker/objects/Numbers.h"
#include "cimxml/XmlText.h"
#include "util/Names.h"

namespace zorva::cimxml {

namespace {

using broker::InstanceObject;
using broker::PropertyInfo;

constexpr std::string_view kValue = "<VALUE>";
constexpr std::string_view kNoValue = "<VALUE></VALUE>";

bool isPlain(CMPIType type) noexcept {
  return type == CMPI_string || type == CMPI_dateTime || type == CMPI_boolean || broker::isUnsignedType(type) ||
         broker::isSignedType(type);
}

/// `data` is of a plain type and not null.
void appendContent(std::string& out, const CMPIData& data) {
  const PlainContent content(out);
  if (data.type == CMPI_string) {
    appendEscaped(out, broker::own<broker::StringObject>(data.value.string)->view());
  } else if (data.type == CMPI_dateTime) {
    appendEscaped(out, broker::own<broker::DateTimeObject>(data.value.dateTime)->text->view());
  } else if (data.type == CMPI_boolean) {
    content(data.value.boolean != 0);
  } else if (broker::isUnsignedType(data.type)) {
    content(broker::unsignedOf(data));
  } else {
    content(broker::signedOf(data));
  }
}

bool isAsDeclared(const InstanceObject::Slot& slot, const PropertyInfo& property) noexcept {
  return slot.property == &property && slot.data.type == property.type;
}

bool isPlainKey(const InstanceObject::Slot* slot) noexcept {
  return slot != nullptr && slot->data.state == CMPI_goodValue && isPlain(slot->data.type);
}

/// Whether all instances with the same properties in the same order differ in nothing but their values.
bool isOfAForm(const InstanceObject& object) {
  const auto& keys = object.info->keys();
  return object.looseKeys == nullptr &&
         std::all_of(object.slots, object.slots + object.count,
                     [](const auto& slot) { return isAsDeclared(slot, *slot.property); }) &&
         std::all_of(keys.begin(), keys.end(), [&](const auto* key) { return isPlainKey(object.find(*key)); });
}

}  // namespace

void ObjectWriter::append(std::string& out, const InstanceObject& object, const broker::PropertyMask& wanted) {
  if (!fits(object, wanted)) {
    fillInstance(object, wanted, instance_);
    if (!isOfAForm(object)) {
      out += "<VALUE.NAMEDINSTANCE>";
      appendInstanceName(out, instance_.path);
      instances_.append(out, instance_);
      out += "</VALUE.NAMEDINSTANCE>";
      return;
    }
    makeForm(object, wanted);
  }
  fillForm(out, object);
}

bool ObjectWriter::fits(const InstanceObject& object, const broker::PropertyMask& wanted) const noexcept {
  if (object.info != info_ || wanted.bits != wanted_ || object.count != slots_.size()) return false;
  if (object.looseKeys != nullptr) return false;
  for (std::uint32_t i = 0; i < object.count; ++i) {
    if (!isAsDeclared(object.slots[i], *slots_[i])) return false;
  }
  for (std::size_t i = 0; i < object.info->keys().size(); ++i) {
    if (object.slots[holes_[i].slot].data.state != CMPI_goodValue) return false;
  }
  return true;
}

void ObjectWriter::makeForm(const InstanceObject& object, const broker::PropertyMask& wanted) {
  info_ = nullptr;  // until the form is complete
  wanted_ = wanted.bits;
  slots_.clear();
  for (std::uint32_t i = 0; i < object.count; ++i) slots_.push_back(object.slots[i].property);
  holes_.clear();
  text_ = "<VALUE.NAMEDINSTANCE>";
  addName(object);
  addProperties(object, wanted);
  text_ += "</VALUE.NAMEDINSTANCE>";
  info_ = object.info;
}

void ObjectWriter::addName(const InstanceObject& object) {
  text_ += "<INSTANCENAME";
  appendAttribute(text_, "CLASSNAME", instance_.path.className);
  text_ += '>';
  for (std::size_t i = 0; i < instance_.path.keys.size(); ++i) {
    appendKeyBegin(text_, instance_.path.keys[i]);
    const auto slot = static_cast<std::uint32_t>(object.find(*object.info->keys()[i]) - object.slots);
    holes_.push_back({Kind::Key, slot, text_.size()});
    appendKeyEnd(text_);
  }
  text_ += "</INSTANCENAME>";
}

/// The plain instance has the wanted properties that are set first, in the order of the object.
void ObjectWriter::addProperties(const InstanceObject& object, const broker::PropertyMask& wanted) {
  const InstanceWriter::Form& form = instances_.formOf(instance_);
  auto value = form.values.begin();
  std::size_t done = 0;
  for (std::uint32_t i = 0; i < object.count; ++i) {
    const PropertyInfo& property = *object.slots[i].property;
    if (!wanted.has(property)) continue;
    text_.append(form.text, done, value->place - done);
    done = value->place;
    ++value;
    const bool isPlainOne = isPlain(property.type);
    holes_.push_back({isPlainOne ? Kind::Plain : Kind::Other, i, text_.size()});
    if (isPlainOne) text_ += kNoValue;
  }
  text_.append(form.text, done);
}

void ObjectWriter::fillForm(std::string& out, const InstanceObject& object) {
  std::size_t done = 0;
  const auto copyUpTo = [&](std::size_t place) {
    out.append(text_, done, place - done);
    done = place;
  };
  for (const Hole& hole : holes_) {
    const CMPIData& data = object.slots[hole.slot].data;
    if (hole.kind == Kind::Other) {
      copyUpTo(hole.place);
      fillValue(data, value_);
      appendValue(out, value_);
    } else if (data.state == CMPI_goodValue) {
      copyUpTo(hole.place + (hole.kind == Kind::Plain ? kValue.size() : 0));
      appendContent(out, data);
    } else {
      copyUpTo(hole.place);
      done += kNoValue.size();
    }
  }
  out.append(text_, done);
}

std::unique_ptr<ObjectWriters::Entry> ObjectWriters::take(std::string_view className) {
  const std::lock_guard lock(mutex_);
  const auto known = std::find_if(idle_.begin(), idle_.end(),
                                  [&](const auto& entry) { return util::sameName(entry->className, className); });
  if (known == idle_.end()) return std::make_unique<Entry>(Entry{std::string(className)});
  std::unique_ptr<Entry> entry = std::move(*known);
  idle_.erase(known);
  entry->writer.beginRequest();
  return entry;
}

std::size_t ObjectWriters::size() const {
  const std::lock_guard lock(mutex_);
  return idle_.size();
}

/// The one that was not used for longest makes room. A name of which nothing was written may be anything that a client
/// sent, of any length: it is not kept.
void ObjectWriters::giveBack(std::unique_ptr<Entry> entry) noexcept {
  if (!entry->writer.hasForm()) return;
  const std::lock_guard lock(mutex_);
  if (idle_.size() == kMost) idle_.erase(idle_.begin());
  idle_.push_back(std::move(entry));
}

}  // namespace zorva::cimxml
