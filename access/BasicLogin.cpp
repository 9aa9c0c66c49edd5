#include "access/BasicLogin.h"

#include <gnutls/gnutls.h>

#include <cstddef>

#include "access/PasswordHash.h"
#include "access/Users.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::access {

namespace {

constexpr std::size_t kLongestText = 1024;

/// Empty if it is no base64.
std::string fromBase64(std::string_view text) {
  const gnutls_datum_t encoded{reinterpret_cast<unsigned char*>(const_cast<char*>(text.data())),
                               static_cast<unsigned>(text.size())};
  gnutls_datum_t plain{};
  if (::gnutls_base64_decode2(&encoded, &plain) != GNUTLS_E_SUCCESS) return {};
  std::string decoded(reinterpret_cast<const char*>(plain.data), plain.size);
  ::gnutls_memset(plain.data, 0, plain.size);
  ::gnutls_free(plain.data);
  return decoded;
}

}  // namespace

std::optional<BasicLogin> readBasicLogin(std::string_view authorization) {
  constexpr std::string_view kScheme = "Basic ";
  if (authorization.size() > kLongestText) return std::nullopt;
  if (!util::sameName(authorization.substr(0, kScheme.size()), kScheme)) return std::nullopt;
  const std::string_view encoded = util::trimmed(authorization.substr(kScheme.size()));
  if (encoded.empty()) return std::nullopt;
  const std::string text = fromBase64(encoded);
  const std::size_t colon = text.find(':');
  if (colon == std::string::npos || text.find('\0') != std::string::npos) return std::nullopt;
  BasicLogin login{text.substr(0, colon), text.substr(colon + 1)};
  if (!isUserName(login.user) || login.password.empty() || login.password.size() > kLongestPassword) {
    return std::nullopt;
  }
  return login;
}

}  // namespace zorva::access
