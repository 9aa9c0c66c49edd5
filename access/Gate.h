#pragma once

// Decides who a client is and what it may do. Thread-safe.

#include <chrono>
#include <cstdint>
#include <string>

#include "access/Origin.h"
#include "access/Role.h"
#include "util/NotCopied.h"

namespace zorva::access {

struct Decision {
  enum class Kind : std::uint8_t {
    Admitted,    ///< `client` is set
    MustVerify,  ///< that needs slow work, such as checking a password: call verify() on a thread that may wait
    NeedsLogin,  ///< the client has to log in, or its login is wrong: HTTP status 401
    TooEarly,    ///< logins of this address failed, the next one is taken after `delay`: HTTP status 503
    Refused,     ///< a login would not help: HTTP status 403
  };

  Kind kind = Kind::Refused;
  ClientPtr client = nullptr;
  std::string why = {};  ///< of a refusal: a sentence for the client's user
  /// NeedsLogin: how long the answer to a failed login is held back. TooEarly: when to come again.
  std::chrono::milliseconds delay{0};
};

class Gate : util::NotCopied {
 public:
  virtual ~Gate() = default;

  /// Decides what needs no slow work. `authorization` is the value of the header field Authorization, null if the
  /// request has none. Called on event threads for each request, so it must be quick and must not wait.
  virtual Decision decide(const Origin& origin, const std::string* authorization) = 0;

  /// Decides the rest; checking a password takes some tens of milliseconds of processor time. `authorization` is empty
  /// if the request has none. Called on one thread at a time.
  virtual Decision verify(const Origin& origin, const std::string& authorization) = 0;
};

/// Lets every client in, with the same role.
class OpenGate final : public Gate {
 public:
  explicit OpenGate(Role role)
      : client_(std::make_shared<const Client>(Client{std::string(), Proof::None, Grants(role)})) {}

  Decision decide(const Origin&, const std::string*) override { return {Decision::Kind::Admitted, client_}; }
  Decision verify(const Origin&, const std::string&) override { return {Decision::Kind::Admitted, client_}; }

 private:
  const ClientPtr client_;
};

}  // namespace zorva::access
