#pragma once

// The file "bmc.json": what zorva-bmc read from the service processor, for the agents of this host.

#include <cstdint>
#include <memory>
#include <string>

#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// After that many intervals without an answer it is not known what the service processor has.
inline constexpr std::uint64_t kBmcIntervals = 10;

/// What was read, and when.
struct BmcState {
  std::uint64_t readAt = 0;                  ///< seconds since 1970; 0: nothing was read yet
  std::uint64_t interval = 60;               ///< seconds from one reading to the next
  std::string problem;                       ///< why the latest reading failed, one line; empty if it did not
  std::shared_ptr<const TreeSnapshot> tree;  ///< the service processors; never null in a state that was read

  /// Whether what was read is so old that it counts as unknown. A clock that was set back makes nothing old.
  bool isUnknownAt(std::uint64_t seconds) const { return seconds > readAt + kBmcIntervals * interval; }
};

/// The name of a service processor's node begins with it, so that no node of the host has the same.
inline constexpr const char* kBmcNodePrefix = "bmc.";

/// The socket beside the file, at which zorva-bmc takes changes.
std::string bmcSocketBeside(const std::string& file);

/// The limits of the file, in bytes and in interfaces.
inline constexpr std::size_t kLargestBmcJson = std::size_t{4} << 20;
inline constexpr std::size_t kMostBmcInterfaces = 1024;

std::string formatBmcState(const BmcState& state);

/// Throws ConfigError, under the file's name and with line and key, if it cannot be read or holds anything but the
/// nodes of service processors.
BmcState readBmcState(const std::string& path);
BmcState parseBmcState(const std::string& text, const std::string& name);

}  // namespace zorva::agent
