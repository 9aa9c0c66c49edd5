#pragma once

// Checks what the XML reader does not check, and limits the size of its result. A text that passes is well-formed UTF-8
// of XML's characters, has one root element, refers to no entity except XML's own five, and is within the limits. The
// reader itself checks for tags that do not match and for malformed attributes.

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "util/Expected.h"

namespace zorva::cimxml {

struct XmlLimits {
  std::size_t depth = 128;         ///< nested elements
  std::size_t elements = 200'000;  ///< in all
  /// Called now and then while a text is read; true ends the reading. May be empty.
  std::function<bool()> isOver = {};
};

/// The message of a reading that isOver has ended.
inline constexpr const char* kTimeIsOver = "the time for this request was over before it was read";

/// The place of an error in a text, and its reason.
struct XmlProblem {
  std::size_t position = 0;  ///< in bytes from 0
  std::string message;
  bool isLimit = false;  ///< only the size is wrong
  bool isOver = false;   ///< the reading was ended
};

/// The error of a text that does not pass. Takes time in proportion to the text, and no memory.
Expected<void, XmlProblem> checkXml(std::string_view text, const XmlLimits& limits);

/// "line L, column C" of a byte, both from 1, the column counted in bytes.
std::string placeText(std::string_view text, std::size_t position);

}  // namespace zorva::cimxml
