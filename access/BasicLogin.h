#pragma once

// HTTP Basic (RFC 7617): the name and the password in the header field Authorization.

#include <optional>
#include <string>
#include <string_view>

namespace zorva::access {

struct BasicLogin {
  std::string user;
  std::string password;  ///< without NUL, at most kLongestPassword bytes
};

/// Nothing if the value is no Basic login that could be right: another scheme, no base64, no colon, too long.
std::optional<BasicLogin> readBasicLogin(std::string_view authorization);

}  // namespace zorva::access
