#pragma once

// Loads a provider library when the first request needs it. All MIs of a provider are made once and together: its
// create functions store the broker where its operations read it without a lock, so no create function may run once
// another MI is in use. Safe on any thread.

#include <cmpidt.h>
#include <cmpift.h>

#include <atomic>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <vector>

#include "broker/core/BrokerOptions.h"
#include "broker/core/ProviderRegistry.h"
#include "broker/objects/Value.h"
#include "util/NotCopied.h"

namespace zorva::broker {

class BlockCache;
class ClassTable;

/// What the loader needs of its broker.
struct LoaderHost {
  const CMPIBroker* handle;  ///< given to create functions
  const ClassTable& classes;
  BlockCache& blocks;
  std::function<void(const std::string& warning)> warn;  ///< does not throw
};

class ProviderLoader : util::NotCopied {
 public:
  ProviderLoader(LoaderHost host, const ProviderRegistry& registry, std::string directory,
                 std::vector<LinkedFunction> linked);

  /// Calls the cleanup of every MI that was made, then closes the libraries, except those that ask to stay loaded.
  ~ProviderLoader();

  /// The MI for a registry entry; null on a failure, which says what is missing. A failure is not remembered: the next
  /// request tries again.
  const CMPIInstanceMI* instanceMi(const ProviderEntry& entry, Status& status);
  const CMPIAssociationMI* associationMi(const ProviderEntry& entry, Status& status);
  const CMPIMethodMI* methodMi(const ProviderEntry& entry, Status& status);

  /// Opens every library that the registry names. Returns a sentence with the reason for each one that cannot be
  /// opened.
  std::vector<std::string> openAll();

 private:
  struct Library;
  /// One prefix in one library; several registry entries may share it.
  struct Provider {
    std::string prefix;
    std::string library;
    std::string nameSpace;
    unsigned kinds = 0;
    bool isBeingMade = false;  ///< guarded by mutex_
    std::atomic<const CMPIInstanceMI*> instance = nullptr;
    std::atomic<const CMPIAssociationMI*> association = nullptr;
    std::atomic<const CMPIMethodMI*> method = nullptr;
  };

  Provider& providerOf(const ProviderEntry& entry) const;
  Library* open(const std::string& name, Status& status);
  /// A create function, from the program itself for a provider without library. Null on a failure.
  void* findFunction(const Provider& provider, const std::string& function, Status& status);
  /// Makes the provider's missing kinds and publishes it. `status` is that of the kind `wanted`.
  void makeAll(Provider& provider, MiKind wanted, Status& status);
  template <typename Mi>
  const Mi* make(const Provider& provider, const char* kind, Status& status);
  template <typename Mi>
  const Mi* find(const ProviderEntry& entry, std::atomic<const Mi*> Provider::*slot, MiKind kind, Status& status);
  template <typename Mi>
  bool cleanUp(Provider& provider, std::atomic<const Mi*> Provider::*slot) noexcept;

  const LoaderHost host_;
  const std::string directory_;
  const std::vector<LinkedFunction> linked_;
  std::vector<std::unique_ptr<Provider>> providers_;
  /// A create function may call up into the broker, which may need another provider.
  std::recursive_mutex mutex_;
  std::unordered_map<std::string, std::unique_ptr<Library>> libraries_;
};

}  // namespace zorva::broker
