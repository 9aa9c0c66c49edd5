#pragma once

// JSON documents (RFC 8259) of the views that commands make of what they read (output/JsonDocument.h).

#include <string>
#include <vector>

#include "access/Users.h"
#include "agent/apply/Apply.h"
#include "cli/commands/Graph.h"
#include "cli/output/TreeText.h"
#include "cli/session/ClassRows.h"
#include "cli/session/HostView.h"
#include "cli/session/SettingFile.h"
#include "cli/session/SettingFiles.h"
#include "dns/ServerCheck.h"

namespace zorva::cli {

/// The result of `show`: "system", "interfaces" and "host". What is not known is null or an empty list, so that the
/// document has the same fields with and without a server.
std::string hostViewJson(const HostView& view);

/// The path and the lines of an interface's file: "file" and "lines", each with "key" and "value".
std::string settingFileJson(const std::string& path, const std::vector<SettingLine>& lines);

/// Each with "file", "interface", "exists" (the interface), "keys" and "problem".
std::string listedFilesJson(const std::vector<ListedFile>& files);

/// The values of the overlay: "node", "property", "value".
std::string overlayJson(const std::vector<OverlayRow>& rows);

/// A number under that name.
std::string countJson(const char* name, std::size_t count);

/// The results of `apply` and `revert`, in order: "interface", "owner", "profile", "changes" with the "property" and
/// its values "before" and "after", and, where there is one, the "problem" or the "note".
std::string applyResultsJson(const std::vector<zorva::agent::ApplyResult>& results);

/// "objects", each with "path" and, if it cannot be fetched, "problem"; "associations" with their class and the indices
/// of their ends in the list of objects.
std::string graphJson(const Graph& graph);

/// The result of `check`: "question", "servers", "suffixes", "problems".
std::string checkJson(const dns::CheckResult& result);

/// The users of the server: "name", "role", "namespaces" with the role in each, "has_password", "fingerprints" and
/// "subject".
std::string usersJson(const std::vector<const access::User*>& users);

/// The rows of `classes`.
std::string classRowsJson(const std::vector<ClassRow>& rows);

}  // namespace zorva::cli
