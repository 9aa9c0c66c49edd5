#pragma once

// The owners of DNS settings that run on this host, and which of them speaks for which interface.

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "agent/sources/NetworkManager.h"
#include "agent/sources/Networkd.h"
#include "agent/sources/Resolved.h"
#include "agent/sources/SystemBus.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

/// Follows NetworkManager, systemd-resolved and systemd-networkd over the system's bus. Without a bus there are none.
///
/// Belongs to one thread at a time. In a forked process reopen() is called before anything else.
class DnsOwners {
 public:
  /// Waited for all of them together, at one look.
  static constexpr std::chrono::milliseconds kLongestWait{250};

  /// root is put before the path of each file, the bus's socket included; for tests.
  explicit DnsOwners(const std::string& root);
  ~DnsOwners();

  /// The bus's socket: the caller looks again when something happens to it.
  const std::string& busSocket() const { return socket_; }

  /// Whether the owners may say something else than at the last look. Never blocks.
  bool changed();

  /// Asks those that may have something new to say, and waits for them. Who does not answer in time is not waited for
  /// again until it has answered; what it said before holds meanwhile.
  void look(const std::vector<Link>& links);

  /// Adds what wakes a thread when changed() may be true.
  void addWakers(Wakers& wakers);

  void reopen();

  /// Who has not answered yet, in words; empty where nobody is missing, or where there is no bus.
  std::string whoIsLate() const;

  /// Whether the owner of that name is on the bus.
  bool runs(const std::string& owner) const;

  /// What holds for a link, by the rules on the owner of an interface in docs/host.md; no lists where no owner has any.
  DnsFacts factsOf(const Link& link) const;

  /// Whether any owner names a server or a domain for any of these links.
  bool speakForAny(const std::vector<Link>& links) const;

  /// What belongs to the host and to no link, or null where nobody keeps such settings.
  const DnsFacts* hostFacts() const { return resolved_.hostFacts(); }

 private:
  void connect();
  bool canConnectNow();
  void disconnect();
  void handleArrived();
  bool isSettled() const;
  std::string namesOf(bool (DnsOwner::*holds)() const) const;
  void giveUpWaiting();

  std::string socket_;
  SystemBus bus_;
  NetworkManager networkManager_;
  Resolved resolved_;
  Networkd networkd_;
  std::vector<DnsOwner*> all_;
  std::chrono::steady_clock::time_point lastTry_;  ///< to connect
  bool lost_ = false;                              ///< the connection; there was one at the last look
};

}  // namespace zorva::agent
