#pragma once

// JSON (RFC 8259) of what CIM operations give: documents (JsonDocument.h), and the elements of lists that are written
// one by one. Bytes that are no UTF-8 come out as asUtf8() has them.

#include <cstddef>
#include <string>
#include <vector>

#include "broker/Broker.h"

namespace zorva::cli {

/// An instance as an object: "class", "path", "properties" in the order in which they were set, and "words": those that
/// the class has for numbers, under the names of their properties. A null property is null, a reference is the text of
/// its path. `depth` is the indent in blanks of the lines after the first.
std::string instanceJson(const broker::Instance& instance, std::size_t depth);

/// One instance as a document.
std::string instanceDocument(const broker::Instance& instance);

/// A path's text as a JSON string.
std::string pathJson(const broker::ObjectPath& path);

/// The result of a method: "return_value" and "output".
std::string methodResultJson(const broker::MethodResult& result);

/// A call of a method that is not made: "path", "method" and "input".
std::string methodCallJson(const broker::ObjectPath& path, const std::string& method,
                           const std::vector<broker::NamedValue>& input);

/// A list of texts.
std::string textsJson(const std::vector<std::string>& texts);

}  // namespace zorva::cli
