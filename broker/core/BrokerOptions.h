#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "broker/core/ProviderRegistry.h"
#include "broker/objects/Value.h"

// What a broker is made with: its registry, and what its owner does about log lines and claims.

namespace zorva::broker {

enum class LogLevel { Debug, Info, Warning, Error };

/// Takes one line of the broker's or, through the broker, of a provider's log.
using LogHook = std::function<void(LogLevel level, std::string_view text)>;

/// What a request does to what other processes use as well.
enum class Access { Read, Change };

/// What a request holds while its provider reads or changes such things, so that others keep away from them.
class Claim {
 public:
  virtual ~Claim() = default;
  /// Asked after a change has been made: a failure that the provider did not notice.
  virtual Status finish() { return {}; }
};

/// Asked for a claim before a provider of that class is called; null: the class needs none. `changed` is the path of
/// what is to be changed, null for Access::Read. What it throws ends the request. Of a read the claim goes when the
/// provider returns its first result, or ends: it has read all by then, and a slow client must not hold up others.
/// Requests of a provider within one that has a claim do without. Called on any thread.
using ClaimHook =
    std::function<std::unique_ptr<Claim>(Access access, std::string_view className, const ObjectPath* changed)>;

/// A create function (CMPI 2.0) of a provider that is part of the program: "<prefix>_Create_InstanceMI" and so on.
struct LinkedFunction {
  std::string name;
  void (*function)();  ///< cast from its own type
};

struct BrokerOptions {
  ProviderRegistry registry = ProviderRegistry::builtIn();
  std::vector<LinkedFunction> linked = {};  ///< for the entries of the registry that name no library
  std::string providerDirectory =
      {};                ///< where libraries named without "/" lie; empty: the dynamic loader's own search
  LogHook log = {};      ///< may be empty
  ClaimHook claim = {};  ///< may be empty
};

}  // namespace zorva::broker
