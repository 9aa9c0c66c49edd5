#pragma once

// The options of a broker: its registry, and its owner's hooks for log lines and claims.

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "broker/core/ProviderRegistry.h"
#include "broker/objects/Value.h"
#include "util/LogLevels.h"

namespace zorva::broker {

/// On the scale of the agent's levels.
enum class LogLevel : int {
  Debug = util::kLevelFlow,
  Info = util::kLevelDetail,
  Warning = util::kLevelWarning,
  Error = util::kLevelError,
};

/// Takes one log line of the broker, or of a provider that logs through the broker.
using LogHook = std::function<void(LogLevel level, std::string_view text)>;

/// How a request uses data that other processes use as well.
enum class Access { Read, Change };

/// A lock that a request holds while its provider reads or changes such data.
class Claim {
 public:
  virtual ~Claim() = default;
  /// Called after a change: returns a failure that the provider did not notice.
  virtual Status finish() { return {}; }
};

/// Called for a claim before a provider of that class is called; null means that the class needs none. `changed` is the
/// path of the object to change, null for Access::Read. If it throws, the request ends with that exception. The claim
/// of a read is dropped when the provider returns its first result, or ends: by then the provider has read everything,
/// and a slow client must not block others. A nested request of a provider uses the claim of the outer request. Called
/// on any thread.
using ClaimHook =
    std::function<std::unique_ptr<Claim>(Access access, std::string_view className, const ObjectPath* changed)>;

/// A create function (CMPI 2.0) of a provider that is linked into the program: "<prefix>_Create_InstanceMI" and so on.
struct LinkedFunction {
  std::string name;
  void (*function)();  ///< cast from its own type
};

struct BrokerOptions {
  ProviderRegistry registry = ProviderRegistry::builtIn();
  std::vector<LinkedFunction> linked = {};  ///< for registry entries that name no library
  std::string providerDirectory = {};  ///< directory of libraries named without "/"; empty: the dynamic loader searches
  LogHook log = {};                    ///< may be empty
  ClaimHook claim = {};                ///< may be empty
};

}  // namespace zorva::broker
