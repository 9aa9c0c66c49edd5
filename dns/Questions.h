#pragma once

// Asks DNS servers over UDP, all at the same time, from sockets of our own: no resolver of the host takes part.

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "dns/Message.h"
#include "dns/ServerAddress.h"

namespace zorva::dns {

struct Inquiry {
  ServerAddress server;
  Question question;
};

struct Answer {
  enum class Kind {
    Response,     ///< the server answered; a refusal is an answer, too
    Malformed,    ///< what came from it in time could not be read
    None,         ///< nothing came in time
    Unreachable,  ///< no packet can be sent there, or nothing listens there
  };
  Kind kind = Kind::None;
  Response response;
  std::chrono::microseconds time{};  ///< from the query to the response
  std::string problem;               ///< of the kinds Malformed and Unreachable: what is wrong
};

/// The answers in the order of the inquiries. Waits at most `timeout` for each; above 256 at once they take turns. A
/// packet from another address, with another id or about another question is ignored. Names must be such for isName().
std::vector<Answer> ask(const std::vector<Inquiry>& inquiries, std::chrono::milliseconds timeout);

}  // namespace zorva::dns
