#pragma once

// Asks the configured DNS servers themselves, and looks for settings that no program uses.

#include <optional>
#include <string>
#include <vector>

#include "cli/session/HostView.h"
#include "dns/Questions.h"

namespace zorva::cli {

struct CheckedServer {
  std::string server;                     ///< "192.0.2.1", "[2001:db8::1]:5353", or the text that is no address
  std::vector<std::string> usedBy;        ///< interfaces, "host" for the host's resolver, "systemd-resolved"
  std::vector<std::string> neverAskedBy;  ///< of these, those that list it and do not ask it
  dns::Answer answer;

  bool isGood() const noexcept {
    return answer.kind == dns::Answer::Kind::Response && answer.response.code == dns::ResponseCode::NoError;
  }

  /// "NOERROR", "no answer", "unreachable: Network is unreachable".
  std::string answerText() const;
};

struct CheckedSuffix {
  std::string suffix;
  std::vector<std::string> usedBy;
  std::optional<bool> resolves;  ///< nothing: no server that is asked for it said so or so
};

struct CheckResult {
  dns::Question question;
  std::vector<CheckedServer> servers;
  std::vector<CheckedSuffix> suffixes;
  std::vector<std::string> problems;  ///< each in a sentence
};

/// Asks each server of the interfaces of the view once, and with `asksHost` those of the host, all in parallel. For a
/// suffix the first three servers of the interface that has it are asked, or of the host where it has none.
CheckResult checkServers(const HostView& view, bool asksHost, const dns::Question& question);

}  // namespace zorva::cli
