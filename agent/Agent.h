// The agent's own interface, for programs of this project: configuration, tree, log and overlay of the process.
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/config/Config.h"
#include "agent/interface/AgentApi.h"
#include "agent/log/LogSink.h"
#include "agent/tree/TreeSnapshot.h"

// All functions are thread-safe. Texts are bytes as the host gives them, UTF-8 by convention.
namespace zorva::agent {

// Reads and checks the configuration: that file, or the one that the environment asks for where the path is empty. It
// holds in the whole process from now on. Throws ConfigError, and what held before stays.
ZORVA_AGENT_API void loadConfig(const std::string& path = {});

// Lets a cursor (ZV::Instrumentation) throw where the configuration or the tree cannot be read, as the functions here
// do: for programs that catch what a provider throws. Without it such a cursor is placed on no node, with a line to the
// log and, once in a process, to syslog: a server that is written in C does not survive an exception.
ZORVA_AGENT_API void askForExceptions();

// The configuration that holds; it is read from where the environment says where nobody has loaded one. Valid until
// the library is unloaded. Throws ConfigError where that is wrong.
ZORVA_AGENT_API const Config& currentConfig();

// The tree of the host as it is now, with the values of the overlay in it. Throws ConfigError for a wrong configuration
// or tree file, std::runtime_error where the host cannot be read.
ZORVA_AGENT_API std::shared_ptr<const TreeSnapshot> currentTree();

// The tree as a JSON document (RFC 8259), which source "file" reads back as the same tree. Bytes that are no UTF-8 are
// written as characters of a private plane, U+10EE00 plus the byte, and so are the bytes of such characters.
ZORVA_AGENT_API std::string treeToJson(const TreeSnapshot& tree);

// The tree that a JSON document describes; name is what errors call the document. Throws ConfigError.
ZORVA_AGENT_API std::shared_ptr<const TreeSnapshot> treeFromJson(const std::string& text, const std::string& name);

// Sets the level of a stream, below which lines are dropped, from now on.
ZORVA_AGENT_API void setLogLevel(LogStream stream, int level);

// Sets where a stream goes from now on: "stderr", "syslog", "off", or the path of a file to append to. Throws
// std::runtime_error, with one line, where that cannot be opened; the stream then goes where it went.
ZORVA_AGENT_API void setLogTarget(LogStream stream, const std::string& target);

// The agent's data directory, with a slash at its end.
ZORVA_AGENT_API std::string dataDirectory();

// One value that was set through the agent.
struct OverlayEntry {
  std::string path;          // of the node
  PropertyNumber property;   // 94, 97, 98 or 99
  std::string propertyName;  // as in the JSON tree: "host_name"
  PropertyValue value;       // a text or a list of texts
};

// The values that were set and stand in for those of the source, also those of nodes that the tree has not got at
// present, by path. Throws ConfigError where the overlay's file is wrong, std::runtime_error where it cannot be read.
ZORVA_AGENT_API std::vector<OverlayEntry> overlayEntries();

// Takes back the values that were set for one interface, by its name or the path of its node, or all of them. Returns
// how many. All of them can be taken back even where the overlay's file is wrong (that counts as none). Throws
// ConfigError where the file is wrong, std::runtime_error, with one line, where it cannot be written.
ZORVA_AGENT_API std::size_t clearOverlay(const std::optional<std::string>& interface = std::nullopt);

}  // namespace zorva::agent
