#pragma once

// The agent's own interface, for programs of this project: configuration, tree, log and overlay of the process.

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/config/Config.h"
#include "agent/interface/AgentApi.h"
#include "agent/log/LogSink.h"
#include "agent/tree/TreeSnapshot.h"

/// All functions are thread-safe. Texts are bytes as the host gives them, UTF-8 by convention.
namespace zorva::agent {

/// Reads and checks the configuration: that file, or the one named by the environment if the path is empty. It is valid
/// in the whole process from now on. Throws ConfigError; then the previous configuration stays.
ZORVA_AGENT_API void loadConfig(const std::string& path = {});

/// Lets a cursor (ZV::Instrumentation) throw if the configuration or the tree cannot be read, as the functions here do.
/// For programs that catch a provider's exceptions. Otherwise such a cursor is placed on no node, with a line to the
/// log and, once in a process, to syslog: a server that is written in C does not survive an exception.
ZORVA_AGENT_API void askForExceptions();

/// The current configuration. If none was loaded, it is read from the file that the environment names. Valid until the
/// library is unloaded. Throws ConfigError if it is wrong.
ZORVA_AGENT_API const Config& currentConfig();

/// The current tree of the host, with the values of the overlay. Throws ConfigError for a wrong configuration or tree
/// file, std::runtime_error if the host cannot be read.
ZORVA_AGENT_API std::shared_ptr<const TreeSnapshot> currentTree();

/// The tree as a JSON document (RFC 8259), which source "file" reads back as the same tree. Bytes that are not UTF-8
/// are written as characters of a private plane, U+10EE00 plus the byte, and so are the bytes of such characters.
ZORVA_AGENT_API std::string treeToJson(const TreeSnapshot& tree);

/// Sets the level of a stream. From now on, lines below it are dropped.
ZORVA_AGENT_API void setLogLevel(LogStream stream, int level);

/// Sets the target of a stream from now on: "stderr", "syslog", "off", or the path of a file to append to. Throws
/// std::runtime_error, with one line, if that cannot be opened; the stream then keeps its target.
ZORVA_AGENT_API void setLogTarget(LogStream stream, const std::string& target);

/// The agent's data directory, with a slash at its end.
ZORVA_AGENT_API std::string dataDirectory();

/// One value that was set through the agent.
struct OverlayEntry {
  std::string path;          ///< of the node
  PropertyNumber property;   ///< 94, 97, 98 or 99
  std::string propertyName;  ///< as in the JSON tree: "host_name"
  PropertyValue value;       ///< a text or a list of texts
};

/// The values that were set, which replace those of the source, by path. Includes those of nodes that are not in the
/// tree at present. Throws ConfigError if the overlay's file is wrong, std::runtime_error if it cannot be read.
ZORVA_AGENT_API std::vector<OverlayEntry> overlayEntries();

/// Removes the values that were set for one interface, by its name or the path of its node, or all of them. Returns how
/// many. All of them can be removed even if the overlay's file is wrong (that counts as none). Throws ConfigError if
/// the file is wrong, std::runtime_error, with one line, if it cannot be written.
ZORVA_AGENT_API std::size_t clearOverlay(const std::optional<std::string>& interface = std::nullopt);

}  // namespace zorva::agent
