#pragma once

// Object paths as people type them, the untyped form of DSP0004 8.2 and DSP0207:
//
//   ZORVA_DNSProtocolEndPoint.Name="eth0",SystemName="host1"
//   root/cimv2:ZORVA_DNSProtocolEndPoint.Name="eth0"
//   //host1/root/cimv2:ZORVA_DNSGenOrderedComponent.GroupComponent="root/cimv2:ZORVA_X.InstanceID=\"a\""
//
// A key's value is a text in double quotes, in which \" \\ \n \t \r \b \f \xHHHH have the same meaning as in MOF, or an
// integer, a real number, TRUE or FALSE. A reference is the text of its path, in quotes like any text. Only the schema
// knows which texts are references, so the reader returns them as texts. These functions keep no state.

#include <cstddef>
#include <string>
#include <string_view>

#include "broker/objects/Value.h"
#include "util/Expected.h"

namespace zorva::broker {

/// The place of an error in a path text, and its reason.
struct PathTextError {
  std::size_t position = 0;  ///< in bytes from 0
  std::string message;       ///< what was expected there and what was found
};

/// The longest accepted text, in bytes.
inline constexpr std::size_t kMaxPathText = 65536;

/// Reads a path; a class name without keys is one too. Time and memory depend only on the length
/// of the text.
Expected<ObjectPath, PathTextError> parsePathText(std::string_view text);

/// The path's text; parsePathText reads it back, with references as texts.
std::string pathText(const ObjectPath& path);

/// A value as in MOF: texts in quotes, an array in braces, NULL. A reference is its path's text in quotes.
std::string literalText(const Value& value);

/// `text` in double quotes, escaped as in MOF.
std::string quotedText(std::string_view text);

}  // namespace zorva::broker
