#pragma once

// Values that were set through the agent and replace those of the tree's source.

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "agent/config/Config.h"
#include "agent/files/FileWatch.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// By the path of a node, then by property.
using OverlayValues = std::map<std::string, std::map<PropertyNumber, PropertyValue>>;

/// The overlay's file cannot be read for a temporary reason, such as a lack of descriptors.
class OverlayUnreadable : public ConfigError {
 public:
  using ConfigError::ConfigError;
};

/// The file "overlay.json" of a data directory, a JSON object of objects: node path, property name, value. Every change
/// reads it again under a lock ("overlay.lock") and replaces it by a new file, so that processes do not lose one
/// another's values and a reader sees either the old file or the new one. Thread-safe.
class Overlay {
 public:
  /// The directory ends in a slash. It is not created: a missing one is probably misspelt.
  explicit Overlay(const std::string& dataDir);

  const std::string& file() const { return file_; }

  /// The content of the file; nothing if there is none. Throws ConfigError if it is wrong or cannot be read,
  /// OverlayUnreadable if the reason is temporary.
  OverlayValues read() const;

  /// The same; nothing if the file is wrong or cannot be read.
  OverlayValues readIfGood() const;

  /// Stores a value, or removes it if none is given. Throws std::runtime_error, with one line, if the file cannot be
  /// written, and ConfigError if it is wrong; the old file is then unchanged.
  void set(const std::string& path, PropertyNumber property, const std::optional<PropertyValue>& value) const;

  /// Removes all values of the nodes whose path the caller selects. Returns how many. Throws as set does.
  std::size_t clear(const std::function<bool(const std::string& path)>& chosen) const;

  /// Removes all values, even if the file cannot be parsed; returns how many could be counted. Throws
  /// std::runtime_error.
  std::size_t clearAll() const;

 private:
  bool isThere() const;
  void write(const OverlayValues& values) const;

  std::string directory_;
  std::string file_;
};

/// Whether a property can be set and the value is of its type.
bool canBeSet(PropertyNumber property, const PropertyValue& value);

/// Follows the changes of a data directory's overlay. Belongs to one thread at a time.
class OverlayReader {
 public:
  explicit OverlayReader(const std::string& dataDir, int comparisons = FileWatch::kComparisons)
      : overlay_(dataDir), watch_(comparisons) {}

  /// Whether the file may have changed since the last read, or could not be read then for a temporary reason; true
  /// before the first read. Never blocks.
  bool changed() { return watch_.changed() || unreadable_; }

  /// As that of a FileWatch.
  int descriptor() const { return unreadable_ ? -1 : watch_.descriptor(); }

  /// Reads the file. A wrong file is logged and counts as empty, so that the host's own values can still be read. If it
  /// cannot be read for a temporary reason, that is logged once, and the previous values are used meanwhile.
  void read();

  /// The tree with these values instead of its own; the same tree if no value belongs to it.
  std::shared_ptr<const TreeSnapshot> applyTo(const std::shared_ptr<const TreeSnapshot>& tree) const;

 private:
  Overlay overlay_;
  FileWatch watch_;
  OverlayValues values_;
  bool unreadable_ = false;
};

}  // namespace zorva::agent
