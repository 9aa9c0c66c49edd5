#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "broker/objects/Value.h"

// Where this host stores what a modification changes: the file of an interface's settings, or the agent's overlay, both
// in the agent's data directory. Safe on any thread.

namespace zorva::frontend {

/// The key of a property in the interface's file ("DNSSERVERS"); null where it is not stored there.
const char* settingKey(std::string_view className, std::string_view property) noexcept;

/// Why this property of this instance cannot be stored on this host at present: there is no file, or no line for it, it
/// cannot be written, the disk is full. Nothing where no reason is found.
std::optional<std::string> missingPlace(const broker::Instance& instance, std::string_view property);

/// The same where it is stored in a file, and that is not there: then a value that the instance has is the host's.
std::optional<std::string> missingFile(const broker::Instance& instance, std::string_view property);

}  // namespace zorva::frontend
