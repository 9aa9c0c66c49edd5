#pragma once

// Providers that are not this project's, for zorvactl and zorvacimd.
//
// A directory names them: each NAME.reg says which class has which provider in which library, in the format of sfcb's
// registrations, and each NAME.mof declares classes. They may use every built-in class.

#include <string>

#include "broker/core/ProviderRegistry.h"
#include "schema/ClassRepository.h"

namespace zorva::frontend {

/// The directory that is read if none is named: providers.d beside the configuration (/etc/zorvagent/providers.d). It
/// need not exist.
std::string usualProviders();

/// Adds the classes and providers of that directory, in the order of the files' names. A library without "/" in its
/// name is libNAME.so beside the registration, else as ProviderEntry::library says. Throws agent::ConfigError for
/// whatever is wrong: it names file and line.
void addProviders(const std::string& directory, broker::ProviderRegistry& registry, schema::ClassRepository& classes);

}  // namespace zorva::frontend
