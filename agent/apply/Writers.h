#pragma once

// The writers of all owners.

#include <memory>
#include <string>

#include "agent/apply/BusCalls.h"
#include "agent/apply/DnsWriter.h"

namespace zorva::agent {

/// Each keeps bus by reference. root is put before the path of each file; for tests.
std::unique_ptr<DnsWriter> makeNetworkManagerWriter(BusCalls& bus);
std::unique_ptr<DnsWriter> makeResolvedWriter(BusCalls& bus);
std::unique_ptr<DnsWriter> makeNetworkdWriter(BusCalls& bus, const std::string& root);
std::unique_ptr<DnsWriter> makeResolvConfWriter(const std::string& root);

/// bmcFile is what zorva-bmc keeps; its socket is beside it.
std::unique_ptr<DnsWriter> makeBmcWriter(const std::string& bmcFile);

/// The writer of an owner of the host, by its name in the tree; null where there is none.
std::unique_ptr<DnsWriter> makeWriter(const std::string& owner, BusCalls& bus, const std::string& root);

}  // namespace zorva::agent
