#pragma once

// The Redfish host interface (DSP0270): the firmware's table says at which address the service processor listens.

#include <optional>
#include <string>
#include <string_view>

namespace zorva::bmc {

/// The table of SMBIOS structures (DSP0134).
inline constexpr const char* kSmbiosTable = "/sys/firmware/dmi/tables/DMI";

/// The URL of the first Redfish service over IP that a structure of type 42 names; nothing if none does. The table may
/// have any bytes.
std::optional<std::string> findHostInterface(std::string_view table);

/// The same of a file; nothing if it cannot be read.
std::optional<std::string> readHostInterface(const std::string& path);

}  // namespace zorva::bmc
