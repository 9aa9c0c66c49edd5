#pragma once

// CIM names (of classes, properties, methods, parameters, qualifiers, namespaces) are matched without regard to the
// case of ASCII letters (DSP0004 5.1.2); other characters are compared as they are. Header fields and host names
// likewise.

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace zorva::util {

constexpr char lowerAscii(char c) noexcept { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

/// Whether two names are the same name.
constexpr bool sameName(std::string_view a, std::string_view b) noexcept {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i) {
    if (lowerAscii(a[i]) != lowerAscii(b[i])) return false;
  }
  return true;
}

/// A hash that is equal for two spellings of one name (FNV-1a over the small letters).
constexpr std::uint32_t nameHash(std::string_view name) noexcept {
  std::uint32_t hash = 2166136261U;
  for (const char c : name) hash = (hash ^ static_cast<unsigned char>(lowerAscii(c))) * 16777619U;
  return hash;
}

/// Hash, equality and order of containers keyed by names; all take a std::string_view without making a string of it.
struct NameHash {
  using is_transparent = void;
  std::size_t operator()(std::string_view name) const noexcept { return nameHash(name); }
};
struct NameEqual {
  using is_transparent = void;
  bool operator()(std::string_view a, std::string_view b) const noexcept { return sameName(a, b); }
};
struct NameLess {
  using is_transparent = void;
  bool operator()(std::string_view a, std::string_view b) const noexcept {
    const std::size_t common = a.size() < b.size() ? a.size() : b.size();
    for (std::size_t i = 0; i < common; ++i) {
      const auto x = static_cast<unsigned char>(lowerAscii(a[i]));
      const auto y = static_cast<unsigned char>(lowerAscii(b[i]));
      if (x != y) return x < y;
    }
    return a.size() < b.size();
  }
};

}  // namespace zorva::util
