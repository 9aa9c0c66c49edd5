#pragma once

// zorva-bmc: reads the service processor at intervals, keeps bmc.json, and makes changes that the agent asks for.

#include <atomic>
#include <chrono>
#include <string>

#include "agent/config/Config.h"
#include "agent/tree/BmcJson.h"
#include "bmc/Change.h"
#include "bmc/Https.h"
#include "bmc/Redfish.h"
#include "util/FileDescriptor.h"

namespace zorva::bmc {

/// How long one reading and one change may take.
struct Patience {
  std::chrono::milliseconds reading{60000};
  std::chrono::milliseconds change{60000};
  std::chrono::milliseconds effect{30000};  ///< of that, until the service shows what was changed
};

/// Where and how the service is asked.
struct Target {
  std::string url;
  Trust trust;
  LoginSource login;
};

/// Used by one thread, but for stop().
class Service : util::NotCopied {
 public:
  /// Takes the last state from the file, if there is one. The directory of the file must exist.
  Service(const agent::BmcConfig& config, Target target, Patience patience = {});

  /// Reads once and replaces the file. False, with a line on standard error, if the service processor could not be
  /// read; then the file keeps what was read before.
  bool readOnce();

  /// Listens for the agent, and reads at each interval, until stop().
  void run();

  /// Ends the session.
  void logOut() noexcept;

  /// Async-signal-safe.
  void stop() noexcept { isStopped_ = true; }

  /// The answer to a request of the agent, as the two of them have it in agent/apply/BmcWriter.cpp.
  std::string answer(const std::string& request);

 private:
  void publish();
  void report(const std::string& problem);
  void openSocket();
  void serveOne();
  JsonValue perform(const JsonValue& request);
  std::string resourceIn(const JsonValue& request) const;
  std::string makeChange(const std::string& resource, const PropertiesOn& propertiesOn);
  void awaitEffect(const std::string& resource, const PropertiesOn& propertiesOn);
  void waitUntil(Clock::time_point next);

  const agent::BmcConfig config_;
  const Patience patience_;
  std::atomic<bool> isStopped_ = false;
  Https https_;
  Redfish redfish_;
  agent::BmcState state_;
  std::string published_;  ///< the text of the file
  std::string reported_;   ///< the problem that is in the log already
  util::FileDescriptor socket_;
};

/// A login with the configuration's user and password file. Throws Failed when it is used and the file is not there, is
/// empty, or may be read by others.
LoginSource loginFromFile(const std::string& user, const std::string& passwordFile);

}  // namespace zorva::bmc
