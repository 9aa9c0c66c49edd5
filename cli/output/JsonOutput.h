#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "cli/commands/Graph.h"
#include "cli/output/TreeText.h"
#include "cli/session/HostView.h"
#include "cli/session/SettingFile.h"

// JSON documents (RFC 8259) of what the commands show. Each text is indented by two blanks and has no line feed at its
// end. Bytes that are no UTF-8 come out as asUtf8() has them.

namespace zorva::cli {

/// An instance as an object: "class", "path", and "properties" in the order in which they were set; a property that is
/// null is null, a reference is the text of its path. `depth` is by how many blanks the lines after the first are
/// shifted.
std::string instanceJson(const broker::Instance& instance, std::size_t depth);

/// A path's text as a JSON string.
std::string pathJson(const broker::ObjectPath& path);

/// What a method gave back: "return_value" and "output".
std::string methodResultJson(const broker::MethodResult& result);

/// What `show` shows.
std::string hostViewJson(const HostView& view);

/// A list of texts.
std::string textsJson(const std::vector<std::string>& texts);

/// The path and the lines of an interface's file: "file" and "lines", each with "key" and "value".
std::string settingFileJson(const std::string& path, const std::vector<SettingLine>& lines);

/// The values of the overlay: "node", "property", "value".
std::string overlayJson(const std::vector<OverlayRow>& rows);

/// "objects", each with "path" and, where it cannot be fetched, "problem"; "associations" with their class and the
/// places of their ends in the list of objects.
std::string graphJson(const Graph& graph);

/// The rows of `classes`.
std::string classRowsJson(const std::vector<ClassRow>& rows);

}  // namespace zorva::cli
