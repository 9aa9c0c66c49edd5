#include "broker/requests/ControlCharacters.h"

#include <cmpidt.h>

#include <algorithm>
#include <cstdio>
#include <string_view>

#include "util/Names.h"
#include "util/Utf8.h"

namespace zorva::broker {

namespace {

constexpr bool isRefused(std::uint32_t code) noexcept {
  return (code < 0x20 && code != '\t') || (code >= 0x7F && code < 0xA0);
}

std::optional<std::uint32_t> findIn(const Scalar& scalar);

std::optional<std::uint32_t> findIn(std::string_view text) {
  while (!text.empty()) {
    const std::size_t length = util::utf8Length(text);
    // Invalid UTF-8 is refused elsewhere.
    const std::uint32_t code = length == 0 ? ' ' : util::utf8Decode(text);
    if (isRefused(code)) return code;
    text.remove_prefix(std::max<std::size_t>(length, 1));
  }
  return std::nullopt;
}

std::optional<std::uint32_t> findIn(const Value& value) {
  if (const auto found = findIn(value.scalar)) return found;
  for (const Scalar& element : value.elements) {
    if (const auto found = findIn(element)) return found;
  }
  return std::nullopt;
}

template <typename Named>
std::optional<std::uint32_t> findIn(const std::vector<Named>& values) {
  for (const Named& one : values) {
    if (const auto found = findIn(one.value)) return found;
  }
  return std::nullopt;
}

std::optional<std::uint32_t> findIn(const Scalar& scalar) {
  if (const auto* text = std::get_if<std::string>(&scalar)) return findIn(std::string_view(*text));
  if (const auto* path = std::get_if<Boxed<ObjectPath>>(&scalar)) return findIn((*path)->keys);
  if (const auto* instance = std::get_if<Boxed<Instance>>(&scalar)) return findIn((*instance)->properties);
  const auto* character = std::get_if<char16_t>(&scalar);
  if (character != nullptr && isRefused(*character)) return *character;
  return std::nullopt;
}

Status refusal(const char* what, const std::string& name, std::uint32_t code) {
  char number[16];
  std::snprintf(number, sizeof number, "U+%04X", static_cast<unsigned>(code));
  return {CMPI_RC_ERR_INVALID_PARAMETER, std::string("the ") + what + " " + name + " has the control character " +
                                             number + "; of these, a text may have the tab alone"};
}

}  // namespace

Status refuseControlCharacters(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList) {
  const auto isListed = [&](const std::string& name) {
    return !propertyList || std::any_of(propertyList->begin(), propertyList->end(),
                                        [&](const std::string& one) { return util::sameName(one, name); });
  };
  for (const Property& property : instance.properties) {
    const auto found = findIn(property.value);
    if (found && isListed(property.name)) return refusal("property", property.name, *found);
  }
  return {};
}

Status refuseControlCharacters(const std::vector<NamedValue>& arguments) {
  for (const NamedValue& argument : arguments) {
    if (const auto found = findIn(argument.value)) return refusal("parameter", argument.name, *found);
  }
  return {};
}

}  // namespace zorva::broker
