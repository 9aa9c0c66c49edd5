#pragma once

// The limits on one client, and on all clients together.

#include <chrono>
#include <cstddef>

namespace zorva::http {

struct HttpLimits {
  std::size_t bodyBytes = std::size_t{4} << 20;     ///< of one request
  std::size_t bodiesBytes = std::size_t{64} << 20;  ///< of all requests together that are still arriving
  std::size_t headerBytes = std::size_t{32} << 10;  ///< request line and header fields of one request
  std::size_t connections = 1000;  ///< open at once; a new one replaces the one that is idle for longest
  std::size_t requests = 256;      ///< in work at once, including those that wait for a worker
  std::size_t workers = 32;        ///< requests that run at once, without those that wait for their client

  std::chrono::milliseconds arrival{30'000};   ///< from the first line of a request to the end of its body
  std::chrono::milliseconds idle{60'000};      ///< between two requests of a connection
  std::chrono::milliseconds provider{60'000};  ///< for the work on a request, without waiting for the client
  std::chrono::milliseconds client{20'000};    ///< for a client that reads nothing of its response
  std::chrono::milliseconds drain{10'000};     ///< for running requests when the server ends

  bool gzip = true;  ///< responses are compressed for clients that accept it

  bool operator==(const HttpLimits&) const = default;
};

}  // namespace zorva::http
