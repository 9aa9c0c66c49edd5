#pragma once

// Queries and responses of DNS (RFC 1035), as far as a question to one server needs them. Whatever arrives is read with
// bounded time and memory.

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "util/Expected.h"

namespace zorva::dns {

enum class Type : std::uint16_t { A = 1, Soa = 6 };

const char* typeName(Type type) noexcept;

/// A name in text form, "example.org"; "." is the root.
struct Question {
  std::string name = ".";
  Type type = Type::Soa;

  bool operator==(const Question&) const = default;
};

inline constexpr std::size_t kLongestMessage = 65535;

/// Whether the text is a name that a query can hold: labels of 1 to 63 bytes, 255 bytes in all on the wire (RFC 1035
/// 2.3.4). A final dot may be left out. There are no escapes: a backslash is a byte like others.
bool isName(std::string_view name) noexcept;

/// The query, which asks for recursion. The name must be one for isName().
std::string encodeQuery(std::uint16_t id, const Question& question);

enum class ResponseCode : std::uint8_t {
  NoError = 0,
  FormErr = 1,
  ServFail = 2,
  NXDomain = 3,
  NotImp = 4,
  Refused = 5
};

/// "NOERROR"; "code 11" for one without a name here.
std::string codeName(ResponseCode code);

struct Response {
  ResponseCode code = ResponseCode::NoError;
  bool isTruncated = false;
  std::size_t answers = 0;  ///< records of the asked type in the answer section
};

/// What keeps a message from being the response to a question.
struct MessageError {
  /// True if the message may belong to somebody else: another id, another question, no response. It is then ignored.
  bool isForeign = false;
  std::string what;
};

/// Reads the response to a query. Every name and record of the answer section must be well-formed, unless the message
/// is truncated. A pointer in a name must point before the place where the name, or the part of it before, begins; so
/// there are no loops.
Expected<Response, MessageError> decodeResponse(std::string_view message, std::uint16_t id, const Question& question);

}  // namespace zorva::dns
