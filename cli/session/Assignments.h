#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"

// name=value words of the command line, with the types that the schema declares.

namespace zorva::cli {

/// What an element is called in errors, and of which type it is.
struct TypedName {
  std::string name;
  schema::Type type = schema::Type::String;
  bool isArray = false;
};

/// The value that the texts stand for: one text for a scalar, any number for an array. A single empty text is the empty
/// array; a single text "null" is CIM's null. Numbers are decimal, or hexadecimal behind 0x; booleans true and false;
/// date-times the 25 characters of DSP0004 5.2.4; references path texts. Throws Failure (wrong usage) for a text that
/// is of another type, holds control characters or is no UTF-8, and for several texts of a scalar.
broker::Value parseValue(const TypedName& declared, const std::vector<std::string>& texts);

/// One name with everything that was given for it, in the order in which names first appear.
struct Assignment {
  std::string name;
  std::vector<std::string> texts;
};

/// Splits words at their first "=" and gathers those of one name, in any case. Throws Failure (wrong usage) for a word
/// without "=" or without a name.
std::vector<Assignment> parseAssignments(const std::vector<std::string>& words);

/// Throws Failure (wrong usage) that names `what` where the text holds control characters or is no UTF-8.
void requirePlainText(std::string_view what, std::string_view text);

}  // namespace zorva::cli
