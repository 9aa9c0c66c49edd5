#include "agent/tree/Node.h"

namespace zorva::agent {
namespace {

template <typename Value>
const Value* valueOf(const Property* property) {
  return property == nullptr ? nullptr : std::get_if<Value>(&property->value);
}

}  // namespace

bool equalValues(const PropertyValue& left, const PropertyValue& right) {
  if (left.index() != right.index()) return false;
  if (const auto* strings = std::get_if<SharedStrings>(&left)) return **strings == *std::get<SharedStrings>(right);
  if (const auto* list = std::get_if<SharedAddresses>(&left)) return **list == *std::get<SharedAddresses>(right);
  return left == right;
}

const Property* Node::find(PropertyNumber number) const {
  for (const Property& property : properties_) {
    if (property.number == number) return &property;
  }
  return nullptr;
}

const std::string* Node::text(PropertyNumber number) const { return valueOf<std::string>(find(number)); }

const unsigned int* Node::number(PropertyNumber number) const { return valueOf<unsigned int>(find(number)); }

const StringList* Node::list(PropertyNumber number) const {
  const auto* list = valueOf<SharedStrings>(find(number));
  return list == nullptr ? nullptr : list->get();
}

const std::string& Node::textOrEmpty(PropertyNumber number) const {
  static const std::string none;
  const std::string* value = text(number);
  return value == nullptr ? none : *value;
}

const StringList& Node::listOrEmpty(PropertyNumber number) const {
  static const StringList none;
  const StringList* value = list(number);
  return value == nullptr ? none : *value;
}

const AddressList& Node::addresses() const {
  static const AddressList none;
  const auto* list = valueOf<SharedAddresses>(find(kAddresses));
  return list == nullptr ? none : **list;
}

}  // namespace zorva::agent
