#pragma once

// What a service processor gives its own host over IPMI (DSP0270, "Credential bootstrapping via IPMI commands"): an
// account of its Redfish service, and the fingerprint of that service's certificate.

#include <functional>
#include <memory>
#include <string>

#include "bmc/Ipmi.h"
#include "bmc/Redfish.h"

namespace zorva::bmc {

/// Asks for a new account. Throws NotOffered if there is none to have, and Failed if the answer is none.
Login askForAccount(Ipmi& ipmi);

/// The SHA-256 of the first certificate, 64 lower-case digits. Throws as askForAccount does.
std::string askForFingerprint(Ipmi& ipmi);

/// The account that the service processor made for this host. It is kept in memory only. Another one is asked for when
/// it is refused, at most once in ten minutes. Used by one thread.
class BootstrapAccount : util::NotCopied {
 public:
  explicit BootstrapAccount(std::shared_ptr<Ipmi> ipmi, std::function<Clock::time_point()> now = Clock::now)
      : ipmi_(std::move(ipmi)), now_(std::move(now)) {}

  /// Asks for an account. Throws NotOffered if there is none to have. After another failure login() throws, and asks
  /// again later.
  void prepare();

  /// Another account than the one with the password that was refused. Null: none was.
  Login login(const util::Secret* refused);

 private:
  void renew();

  const std::shared_ptr<Ipmi> ipmi_;
  const std::function<Clock::time_point()> now_;
  Login account_;  ///< without a password: there is none
  std::string problem_;
  Clock::time_point nextAttempt_ = Clock::time_point::min();
};

}  // namespace zorva::bmc
