#pragma once

// The texts by which other CIM servers learn of the providers. They are made from the registry of the built-in broker,
// so they cannot differ from it.

#include <string>
#include <string_view>
#include <vector>

#include "broker/core/ProviderRegistry.h"

namespace zorva::cli {

/// For the Small Footprint CIM Broker: a section for each class, with the create functions' prefix, the library, the
/// kinds and the namespace. `firstLine` becomes a comment.
std::string sfcbRegistration(const broker::ProviderRegistry& registry, std::string_view firstLine);

/// For OpenPegasus: MOF with a PG_ProviderModule for each library, a PG_Provider for each prefix and a
/// PG_ProviderCapabilities for each class. `version` is that of the modules.
std::string pegasusRegistration(const broker::ProviderRegistry& registry, std::string_view firstLine,
                                const std::string& version);

/// The libraries of the registry, each once, in its order: "zorvahostprofileprovider".
std::vector<std::string> librariesOf(const broker::ProviderRegistry& registry);

/// The namespaces of its providers' classes.
std::vector<std::string> nameSpacesOf(const broker::ProviderRegistry& registry);

}  // namespace zorva::cli
