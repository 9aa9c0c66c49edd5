#pragma once

// Asks the configured DNS servers themselves, and looks for settings that no program uses.

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "dns/Questions.h"

namespace zorva::dns {

/// Something that asks servers in its turn: an interface's resolver, or the host's.
struct Asker {
  std::string name;                   ///< the interface, "host" for the host's resolver, "systemd-resolved"
  std::vector<std::string> servers;   ///< with their ports where they have other than the usual one
  std::vector<std::string> notAsked;  ///< servers after those that it asks
  std::vector<std::string> suffixes;

  bool operator==(const Asker&) const = default;
};

struct CheckedServer {
  std::string server;                     ///< "192.0.2.1", "[2001:db8::1]:5353", or the text that is no address
  std::vector<std::string> usedBy;        ///< names of askers
  std::vector<std::string> neverAskedBy;  ///< of these, those that list it and do not ask it
  Answer answer;

  bool isGood() const noexcept {
    return answer.kind == Answer::Kind::Response && answer.response.code == ResponseCode::NoError;
  }

  /// "NOERROR", "no answer", "unreachable: Network is unreachable".
  std::string answerText() const;
};

struct CheckedSuffix {
  std::string suffix;
  std::vector<std::string> usedBy;
  std::optional<bool> resolves;  ///< nothing: no server that is asked for it said so or so
};

struct CheckProblem {
  enum class Kind : std::uint8_t {
    Twice,           ///< the asker has the server twice
    NeverAsked,      ///< the asker never comes to the server
    NoGoodAnswer,    ///< `text` says what came instead
    DoesNotResolve,  ///< the suffix
  };
  Kind kind;
  std::string subject;  ///< the server or suffix
  std::vector<std::string> askers;
  std::string text{};
};

struct CheckResult {
  Question question;
  std::vector<CheckedServer> servers;
  std::vector<CheckedSuffix> suffixes;
  std::vector<CheckProblem> problems;
};

/// As many servers are asked about a suffix as the C library asks.
inline constexpr std::size_t kServersForSuffix = 3;

/// Asks each server once, all in parallel, and waits two seconds for each answer. About a suffix the first three
/// servers of the asker that has it are asked, or of `hostServers` where it has none.
CheckResult checkServers(const std::vector<Asker>& askers, const std::vector<std::string>& hostServers,
                         const Question& question);

}  // namespace zorva::dns
