#pragma once

// Holds the lock of the agent's data directory while providers use interface files: shared while they read them,
// exclusive while they change settings.

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "agent/SettingsLock.h"
#include "agent/tree/TreeSnapshot.h"
#include "broker/Broker.h"
#include "util/NotCopied.h"

namespace zorva::frontend {

inline constexpr const char* kEndpointClass = "ZORVA_DNSProtocolEndPoint";
inline constexpr const char* kSettingClass = "ZORVA_DNSSettingData";
inline constexpr const char* kGeneralSettingClass = "ZORVA_DNSGeneralSettingData";

class SettingsClaims {
  struct State;

 public:
  SettingsClaims();

  /// For BrokerOptions::claim. Takes the lock for each request of a class whose provider reads or changes interface
  /// files, or changes an endpoint. Thread-safe while no Hold is in use; it may outlive this object.
  broker::ClaimHook hook() const;

  /// The lock for a program that reads, decides and then changes; meanwhile its requests take no lock of their own. For
  /// a program with one thread. A nested Hold does nothing. Throws as zorva::agent::SettingsLock does.
  class Hold : util::NotCopied {
   public:
    explicit Hold(const SettingsClaims& claims);
    ~Hold();

   private:
    std::shared_ptr<State> state_;  ///< null: nested
  };

 private:
  std::shared_ptr<State> state_;
};

/// The interface in an InstanceID of an interface's settings: the text after the first "%".
std::string interfaceOfId(std::string_view instanceId);

/// The InstanceID of an interface's settings: "Computer%eth0", of a service processor "BMC%eth0".
std::string settingIdOf(std::string_view interface, bool isServiceProcessor);

/// The interface whose file has the settings of the host as a whole: that of the first configuration outside a service
/// processor. Nothing if there is none; the empty text if that one has no name.
std::optional<std::string> interfaceOfHostSettings(const zorva::agent::TreeSnapshot& tree);

}  // namespace zorva::frontend
