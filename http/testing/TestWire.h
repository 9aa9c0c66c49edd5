#pragma once

// For tests: a client that sends any bytes, valid HTTP or not.

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "http/Listener.h"
#include "util/FileDescriptor.h"

namespace zorva::http::testing {

/// A response as received.
struct WireResponse {
  int status = 0;
  std::map<std::string, std::string> headers;  ///< names in small letters
  std::string body;                            ///< without chunk framing
  std::map<std::string, std::string> trailers;
  bool complete = false;  ///< it ended as announced
};

class Wire {
 public:
  /// Connects to 127.0.0.1. A small receive buffer, if given, makes a client that reads little at once.
  explicit Wire(int port, int receiveBuffer = 0);

  /// False: the other side has closed the connection.
  bool send(std::string_view bytes);

  /// The next response; a status of 0 if the connection ends without one. Waits no longer than `most` in all.
  WireResponse receive(std::chrono::milliseconds most = std::chrono::seconds(20));

  /// Whether the other side closes within that time; data that it sends until then is dropped.
  bool isClosedWithin(std::chrono::milliseconds time);

  /// Reads up to that many bytes that arrive within the time.
  std::string take(std::size_t most, std::chrono::milliseconds time);

 private:
  bool fill(std::chrono::steady_clock::time_point deadline);
  std::optional<std::string> line(std::chrono::steady_clock::time_point deadline);
  bool bytes(std::size_t count, std::string& out, std::chrono::steady_clock::time_point deadline);
  bool chunks(WireResponse& response, std::chrono::steady_clock::time_point deadline);
  bool fields(std::map<std::string, std::string>& out, std::chrono::steady_clock::time_point deadline);

  util::FileDescriptor socket_;
  std::string unread_;
};

/// A POST with that body; `fields` are further header lines, each with its line end.
std::string posting(std::string_view body, std::string_view fields = {});

/// The same for the instance names of a class of root/cimv2.
std::string enumeration(std::string_view operation, std::string_view className, std::string_view fields = {});

/// The text of a gzip member; empty if it is none.
std::string gunzipped(const std::string& text);

}  // namespace zorva::http::testing
