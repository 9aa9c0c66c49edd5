#pragma once

// Logins whose check takes long: one thread checks them, at a low priority, so that hashing does not compete with
// the requests of clients that are known.
//
// The clients take turns, so a client with a thousand wrong logins does not delay another one's first. The answer to a
// failed login is held back without keeping the thread, and so is that to one that came too early: its client would
// come again at once, and each new connection costs a handshake. The numbers of waiting logins and of held answers are
// limited.

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>

#include "access/Gate.h"
#include "util/NotCopied.h"

namespace zorva::http {

/// A request whose client is not known yet.
struct Applicant {
  access::Origin origin;
  std::string authorization = {};  ///< the value of the header field; empty: none
  /// Takes the decision, which is never MustVerify; called once, on any thread.
  std::function<void(access::Decision)> decided;
};

class LoginQueue : util::NotCopied {
 public:
  static constexpr std::size_t kMost = 512;
  static constexpr std::size_t kMostOfClient = 128;
  static constexpr std::size_t kMostHeld = 64;
  static constexpr std::size_t kMostHeldTooEarly = 128;
  static constexpr std::chrono::milliseconds kTooEarlyIsHeld{1000};
  static constexpr std::chrono::seconds kLongestWait{20};

  explicit LoginQueue(std::shared_ptr<access::Gate> gate);

  /// Gives up all logins and waits for the thread.
  ~LoginQueue();

  /// Takes an applicant; without room, it is decided at once that it must come again.
  void submit(Applicant applicant);

  /// Gives a decision that needs no check, which is Kind::TooEarly: after a while, or at once without room.
  void hold(Applicant applicant, access::Decision decision);

  /// Sends the answers whose delay is over, and gives up the logins that have waited for too long.
  void sweep(std::chrono::steady_clock::time_point now = std::chrono::steady_clock::now());

  /// Logins that wait, that are checked now, or whose answer is held back.
  std::size_t count() const;

  /// Gives up all logins, because the server ends. Later ones are given up at once.
  void giveUpAll();

  /// Waits for the thread to end. False: it is still checking a login when the time is over.
  bool join(std::chrono::milliseconds most);

 private:
  class Core;
  const std::shared_ptr<Core> core_;
};

}  // namespace zorva::http
