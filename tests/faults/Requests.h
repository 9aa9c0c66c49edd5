#pragma once

// Every request that a server can make of the twelve providers, on each of three hosts.

#include <functional>
#include <string>
#include <vector>

#include "tests/support/Providers.h"

namespace ZV::Test {

enum class Kind { Read, Modify, Method, Refused };

struct Request {
  std::string name;  ///< its name in a failure: "Associators of ZORVA_DNSProtocolEndPoint"
  Kind kind = Kind::Read;
  std::function<Outcome(RecordingBroker& broker)> run;
};

/// The requests that a provider accepts; for each one the provider's create function is called again, for that broker.
std::vector<Request> requestsOf(const Provider& provider);

}  // namespace ZV::Test
