#pragma once

// name=value words of the command line, with the types that the schema declares.

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::cli {

/// The name of an element in errors, and its type.
struct TypedName {
  std::string name;
  schema::Type type = schema::Type::String;
  bool isArray = false;
};

/// The value of the texts: one text for a scalar, any number for an array. A single empty text is the empty array; a
/// single text "null" is CIM's null. Numbers are decimal, or hexadecimal with 0x; booleans true and false; date-times
/// the 25 characters of DSP0004 5.2.4; references path texts. Throws Failure (wrong usage) for a text of another type,
/// with control characters or invalid UTF-8, and for several texts of a scalar.
broker::Value parseValue(const TypedName& declared, const std::vector<std::string>& texts);

/// One name with all its values, in the order in which names first appear.
struct Assignment {
  std::string name;
  std::vector<std::string> texts;
};

/// Splits words at their first "=" and gathers those of one name, in any case. Throws Failure (wrong usage) for a word
/// without "=" or without a name.
std::vector<Assignment> parseAssignments(const std::vector<std::string>& words);

/// Throws Failure (wrong usage) that names `what` if the text has control characters or is not UTF-8.
void requirePlainText(std::string_view what, std::string_view text);

}  // namespace zorva::cli
