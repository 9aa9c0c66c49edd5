#pragma once

// A fast reader of plain JSON documents, such as the trees and overlays that the agent itself writes for most hosts.

#include <nlohmann/json.hpp>
#include <string_view>

namespace zorva::agent {

using JsonEvents = nlohmann::json_sax<nlohmann::json>;

/// Reports the events of a document of objects, lists, whole numbers, and texts in printable ASCII without escapes. The
/// line, 1 at first, is that of the current event. False if the document has anything else or is wrong: then nlohmann's
/// parser must read it, for a new receiver. The receiver limits the depth by an exception.
bool readPlainJson(std::string_view document, int& line, JsonEvents& events);

}  // namespace zorva::agent
