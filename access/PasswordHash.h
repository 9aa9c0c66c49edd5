#pragma once

// Hashes of passwords: yescrypt, by crypt(3) of libcrypt. Thread-safe.

#include <cstddef>
#include <string>
#include <string_view>

namespace zorva::access {

inline constexpr std::size_t kLongestPassword = 256;  ///< bytes; libcrypt takes no more than 511

/// Stands for the hash of a user who has no password: "*".
inline constexpr std::string_view kNoPassword = "*";

/// Whether the text is a hash as hashPassword() returns one. Its parameters are fixed, so that each check costs the
/// same.
bool isPasswordHash(std::string_view text) noexcept;

/// A hash of the password with a new salt: "$y$j9T$salt$hash". Takes some tens of milliseconds of processor time.
/// Throws std::runtime_error if libcrypt cannot do it.
std::string hashPassword(const std::string& password);

/// Whether it is the password of that hash. Takes some tens of milliseconds, and the same time if there is no such hash
/// (an empty text, or kNoPassword); then the answer is false.
bool isPasswordOf(const std::string& password, const std::string& hash);

}  // namespace zorva::access
