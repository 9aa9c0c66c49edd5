#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "util/Expected.h"

// What of XML 1.0 the reader behind it does not look at, and bounds on what it builds: a text that passes is
// well-formed UTF-8 of XML's characters, has one root element, refers to no entity but XML's own five, and is no larger
// than said. Tags that do not match, and attributes that are malformed, are left to the reader.

namespace zorva::cimxml {

struct XmlLimits {
  std::size_t depth = 128;         ///< elements within one another
  std::size_t elements = 200'000;  ///< in all
  /// Asked now and then while a text is read; true ends the reading. May be empty.
  std::function<bool()> isOver = {};
};

/// What the reading says that isOver has ended.
inline constexpr const char* kTimeIsOver = "the time for this request was over before it was read";

/// Where a text goes wrong, and how.
struct XmlProblem {
  std::size_t position = 0;  ///< in bytes from 0
  std::string message;
  bool isLimit = false;  ///< nothing is wrong but the size
  bool isOver = false;   ///< the reading was ended
};

/// What is wrong with a text, where it does not pass. Takes time in proportion to the text, and no memory.
Expected<void, XmlProblem> checkXml(std::string_view text, const XmlLimits& limits);

/// "line L, column C" of a byte, both from 1, the column counted in bytes.
std::string placeText(std::string_view text, std::size_t position);

}  // namespace zorva::cimxml
