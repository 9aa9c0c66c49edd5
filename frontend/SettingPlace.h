#pragma once

// Where this host stores a modification: in the interface's settings file, or in the agent's overlay, both in the
// agent's data directory. Safe on any thread.

#include <optional>
#include <string>
#include <string_view>

#include "broker/objects/Value.h"

namespace zorva::frontend {

/// The key of a property in the interface's file ("DNSSERVERS"); null if it is not stored there.
const char* settingKey(std::string_view className, std::string_view property) noexcept;

/// Why this property of this instance cannot be stored on this host now: there is no file, or no line for it, it cannot
/// be written, or the disk is full. Nothing if no reason is found.
std::optional<std::string> missingPlace(const broker::Instance& instance, std::string_view property);

/// The same, but only if the property is stored in a file and the file does not exist. A value that the instance then
/// has comes from the host.
std::optional<std::string> missingFile(const broker::Instance& instance, std::string_view property);

}  // namespace zorva::frontend
