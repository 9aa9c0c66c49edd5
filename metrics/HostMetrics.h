#pragma once

// What Prometheus learns about the DNS settings of the host.

#include <cstdint>
#include <vector>

#include "agent/SettingsDrift.h"
#include "agent/tree/TreeSnapshot.h"
#include "metrics/Exposition.h"

namespace zorva::metrics {

/// The limits of one scrape: what is beyond them is counted and left out.
inline constexpr std::size_t kMostInterfaces = 10'000;
inline constexpr std::size_t kMostServersOfInterface = 16;
inline constexpr std::size_t kMostServers = 50'000;

/// Interfaces with state, suffixes and servers in search order, and the host's resolver. Of interfaces with one name,
/// the first counts.
void writeTree(Exposition& out, const agent::TreeSnapshot& tree);

/// When the service processors were read. `now` is in seconds since 1970.
void writeServiceProcessors(Exposition& out, const agent::TreeSnapshot& tree, std::uint64_t now);

void writeDrift(Exposition& out, const std::vector<agent::SettingsDrift>& drifts);

}  // namespace zorva::metrics
