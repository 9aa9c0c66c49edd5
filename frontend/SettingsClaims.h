#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "agent/SettingsLock.h"
#include "agent/tree/TreeSnapshot.h"
#include "broker/Broker.h"

// The lock of the agent's data directory around what the providers do with interface files: shared while they read
// them, exclusive while settings are changed.

namespace zorva::frontend {

inline constexpr const char* kEndpointClass = "ZORVA_DNSProtocolEndPoint";
inline constexpr const char* kSettingClass = "ZORVA_DNSSettingData";
inline constexpr const char* kGeneralSettingClass = "ZORVA_DNSGeneralSettingData";

class SettingsClaims {
  struct State;

 public:
  SettingsClaims();

  /// For BrokerOptions::claim. Takes the lock for each request of a class whose provider reads or changes interface
  /// files, or changes an endpoint. Thread-safe where nobody uses Hold; it may outlive this.
  broker::ClaimHook hook() const;

  /// The lock for a program that reads, decides and then changes; its requests do without one of their own meanwhile.
  /// For a program of one thread. One within another does nothing. Throws as zorva::agent::SettingsLock does.
  class Hold {
   public:
    explicit Hold(const SettingsClaims& claims);
    ~Hold();
    Hold(const Hold&) = delete;
    Hold& operator=(const Hold&) = delete;

   private:
    std::shared_ptr<State> state_;  // null: within another
  };

 private:
  std::shared_ptr<State> state_;
};

/// The interface that an InstanceID of the settings of an interface names: what follows the first "%".
std::string interfaceOfId(std::string_view instanceId);

/// The interface whose file holds the settings of the host as a whole: that of the first configuration outside a
/// service processor. Nothing where there is none; the empty text where that one has no name.
std::optional<std::string> interfaceOfHostSettings(const zorva::agent::TreeSnapshot& tree);

}  // namespace zorva::frontend
