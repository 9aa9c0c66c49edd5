#pragma once

// The values of the header fields that CIM has over HTTP (DSP0200 1.4): UTF-8 in percent-encoding (7.3). These
// functions keep no state; each may be called on any thread.

#include <optional>
#include <string>
#include <string_view>

namespace zorva::cimxml {

/// `text` as the value of a field: "%" and two digits for each byte but letters, digits and some signs.
std::string fieldValue(std::string_view text);

/// Decodes fieldValue() for a person: a "%" without two digits after it is kept.
std::string fieldText(std::string_view value);

/// Decodes fieldValue() for a program: nothing if a "%" lacks its two digits, or the text is not UTF-8.
std::optional<std::string> strictFieldText(std::string_view value);

}  // namespace zorva::cimxml
