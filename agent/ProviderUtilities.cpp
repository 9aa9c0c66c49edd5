#include "agent/interface/ProviderUtilities.h"

#include <algorithm>
#include <string_view>

namespace ZV::ProviderUtilities {
namespace {

constexpr std::size_t kLongestLabel = 63;  // RFC 1035, 2.3.4
constexpr std::size_t kLongestName = 253;  // its 255 octets of wire form, as text without the final dot

// Only ASCII, independent of the process's locale.
bool isAllowed(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' || c == '_';
}

bool isLabel(std::string_view label) {
  return !label.empty() && label.size() <= kLongestLabel && std::all_of(label.begin(), label.end(), isAllowed);
}

}  // namespace

int ValidateInput(std::string value, std::string) {
  std::string_view rest = value;
  if (rest.empty()) return 1;
  if (rest.ends_with('.')) rest.remove_suffix(1);
  if (rest.size() > kLongestName) return 0;
  for (;;) {
    const std::size_t dot = rest.find('.');
    if (!isLabel(rest.substr(0, dot))) return 0;
    if (dot == std::string_view::npos) return 1;
    rest.remove_prefix(dot + 1);
  }
}

}  // namespace ZV::ProviderUtilities
