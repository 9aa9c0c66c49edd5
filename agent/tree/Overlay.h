// Values that were set through the agent and stand in for those of the tree's source.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "agent/config/Config.h"
#include "agent/files/FileWatch.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

// By the path of a node, then by property.
using OverlayValues = std::map<std::string, std::map<PropertyNumber, PropertyValue>>;

// The overlay's file cannot be read for a reason that may pass, such as the want of a descriptor.
class OverlayUnreadable : public ConfigError {
 public:
  using ConfigError::ConfigError;
};

// The file "overlay.json" of a data directory, a JSON object of objects: node path, property name, value. Every change
// reads it again under a lock ("overlay.lock") and puts a new file in its place, so that processes do not lose one
// another's values and a reader sees either the old file or the new one. Thread-safe.
class Overlay {
 public:
  // The directory ends in a slash. It is not made: one that is missing is more likely misspelt.
  explicit Overlay(const std::string& dataDir);

  const std::string& file() const { return file_; }

  // What stands in the file; nothing where there is none. Throws ConfigError where it is wrong or cannot be read,
  // OverlayUnreadable where that may pass.
  OverlayValues read() const;

  // Stores a value, or takes one back where there is none given. Throws std::runtime_error, with one line, where the
  // file cannot be written, and ConfigError where it is wrong; the old file then stays as it was.
  void set(const std::string& path, PropertyNumber property, const std::optional<PropertyValue>& value) const;

  // Takes back all values of the nodes whose path the caller chooses. Returns how many. Throws as set does.
  std::size_t clear(const std::function<bool(const std::string& path)>& chosen) const;

  // Takes back all there are, whether or not the file can be understood; returns how many could be counted. Throws
  // std::runtime_error.
  std::size_t clearAll() const;

 private:
  bool isThere() const;
  void write(const OverlayValues& values) const;

  std::string directory_;
  std::string file_;
};

// Whether a property is one that can be set and the value is of its type.
bool canBeSet(PropertyNumber property, const PropertyValue& value);

// Keeps up with the overlay of a data directory. Belongs to one thread at a time.
class OverlayReader {
 public:
  explicit OverlayReader(const std::string& dataDir) : overlay_(dataDir) {}

  // Whether the file may have changed since it was read last, or could not be read then for a reason that may pass;
  // true before the first time. Never blocks.
  bool changed() { return watch_.changed() || unreadable_; }

  // Reads the file. A file that is wrong is logged and counts as empty: what the host says can still be read. Where it
  // cannot be read for a reason that may pass, that is logged once, and what was read before holds meanwhile.
  void read();

  // The tree with the values in the place of its own; the same tree where none concerns it.
  std::shared_ptr<const TreeSnapshot> applyTo(const std::shared_ptr<const TreeSnapshot>& tree) const;

 private:
  Overlay overlay_;
  FileWatch watch_;
  OverlayValues values_;
  bool unreadable_ = false;
};

}  // namespace zorva::agent
