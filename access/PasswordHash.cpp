#include "access/PasswordHash.h"

#include <crypt.h>
#include <string.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <stdexcept>
#include <system_error>

namespace zorva::access {

namespace {

// The parameters that libcrypt chooses by itself: 16 MiB of memory.
constexpr std::string_view kMethod = "$y$j9T$";
constexpr std::size_t kHashLength = 43;
constexpr std::size_t kLongestSalt = 86;

// No password has this hash: it only makes a login of an unknown user cost what any other costs.
const std::string kHashOfNobody = "$y$j9T$ZorvaNobodyHasThisSal/$...........................................";

bool isHashText(std::string_view text) noexcept {
  return std::all_of(text.begin(), text.end(), [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '.' || c == '/';
  });
}

/// What crypt(3) works in; it holds the password afterwards.
struct Workspace {
  ~Workspace() { ::explicit_bzero(&data, sizeof data); }
  crypt_data data{};
};

/// Empty if libcrypt cannot do it.
std::string cryptOf(const std::string& password, const std::string& setting) {
  const auto space = std::make_unique<Workspace>();
  const char* hash = ::crypt_r(password.c_str(), setting.c_str(), &space->data);
  return hash == nullptr || *hash == '*' ? std::string() : std::string(hash);
}

/// Takes the same time wherever two texts of one length differ.
bool sameText(const std::string& a, const std::string& b) {
  if (a.size() != b.size()) return false;
  volatile unsigned char difference = 0;
  for (std::size_t i = 0; i < a.size(); ++i) difference = difference | static_cast<unsigned char>(a[i] ^ b[i]);
  return difference == 0;
}

}  // namespace

bool isPasswordHash(std::string_view text) noexcept {
  if (!text.starts_with(kMethod)) return false;
  text.remove_prefix(kMethod.size());
  const std::size_t salt = text.find('$');
  return salt != std::string_view::npos && salt > 0 && salt <= kLongestSalt && isHashText(text.substr(0, salt)) &&
         text.size() - salt - 1 == kHashLength && isHashText(text.substr(salt + 1));
}

std::string hashPassword(const std::string& password) {
  char setting[CRYPT_GENSALT_OUTPUT_SIZE];
  if (::crypt_gensalt_rn("$y$", 0, nullptr, 0, setting, sizeof setting) == nullptr) {
    throw std::runtime_error("libcrypt makes no salt: " + std::generic_category().message(errno));
  }
  std::string hash = cryptOf(password, setting);
  if (!isPasswordHash(hash)) throw std::runtime_error("libcrypt cannot hash the password with yescrypt");
  return hash;
}

bool isPasswordOf(const std::string& password, const std::string& hash) {
  const bool isHash = isPasswordHash(hash);
  const std::string& expected = isHash ? hash : kHashOfNobody;
  const bool fits = sameText(cryptOf(password, expected), expected);
  return isHash && fits;
}

}  // namespace zorva::access
