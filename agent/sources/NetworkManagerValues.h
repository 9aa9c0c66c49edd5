#pragma once

// Values in the forms that they have in NetworkManager's D-Bus interface.

#include "agent/sources/SystemBus.h"
#include "agent/tree/Node.h"

namespace zorva::agent {

/// Each reads the variant that comes next where it has this form, and leaves anything else alone.
void ifTexts(BusReader& reader, StringList& texts);
void ifAddressBytes(BusReader& reader, StringList& addresses);    ///< IPv6 addresses as bytes
void ifAddressNumbers(BusReader& reader, StringList& addresses);  ///< IPv4 addresses as numbers in network order

}  // namespace zorva::agent
