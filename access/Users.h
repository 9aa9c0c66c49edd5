#pragma once

// The users of the server, as their file has them. A line is a user:
//
//   name:hash:role[:namespace=role[,namespace=role...]][:fingerprint=HEX...][:subject=DN]
//
// name         1 to 64 of A-Z a-z 0-9 . _ @ -, first a letter or digit
// hash         of the password, by yescrypt (crypt(5)); "*": the user has none and needs a certificate
// role         read, operate or none: in all namespaces that the line does not name
// fingerprint  SHA-256 of a client certificate, 64 hexadecimal digits; may be repeated
// subject      of a client certificate (RFC 4514); last, because it may contain colons
//
// Empty lines, and lines that begin with '#', are kept as they are.

#include <cstddef>
#include <map>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "access/Origin.h"
#include "access/PasswordHash.h"
#include "access/Role.h"

namespace zorva::access {

struct User {
  std::string name;
  std::string hash = std::string(kNoPassword);
  Grants grants = Grants();
  std::vector<std::string> fingerprints = {};
  std::string subject = {};  ///< empty: none

  bool operator==(const User&) const = default;
};

/// The text is not valid. what() is "file:line: what is wrong", without any hash.
class UsersError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

bool isUserName(std::string_view text) noexcept;
bool isNameSpaceName(std::string_view text) noexcept;

/// "read", "operate", "none"; nothing for other words.
std::optional<Role> roleOf(std::string_view word) noexcept;
std::string_view wordOf(Role role) noexcept;

/// The fingerprint as this file has it: small letters, without the colons or blanks that programs print between the
/// bytes. Empty if it is not SHA-256.
std::string canonicalFingerprint(std::string_view text);

/// The name as this file has it: no blanks around the parts, types in capitals. Empty if it cannot be a name.
std::string canonicalSubject(std::string_view text);

class Users {
 public:
  static constexpr std::size_t kLargest = std::size_t{1} << 20;
  static constexpr std::size_t kMostLines = 10'000;

  Users() = default;

  /// `file` is its name in errors. Throws UsersError.
  Users(const std::string& text, const std::string& file);

  bool isEmpty() const noexcept { return users_.empty(); }

  /// In the order of their names.
  std::vector<const User*> all() const;

  const User* find(std::string_view name) const;

  /// The user to whom a certificate belongs. One found by its fingerprint goes before one found by its subject.
  const User* ofCertificate(const Certificate& certificate) const;

  /// Adds a user, or replaces the one of that name; the other lines stay as they are. Throws std::invalid_argument if a
  /// certificate belongs to another user, or the file would be too large.
  void put(const User& user);

  /// False: there is no such user.
  bool remove(std::string_view name);

  /// The whole file.
  std::string text() const;

 private:
  struct Entry {
    User user;
    std::size_t line;
  };

  void addLine(std::string_view line);
  void index(User user, std::size_t line);
  void forget(const User& user);

  std::vector<std::optional<std::string>> lines_;  ///< nothing: removed
  std::map<std::string, Entry, std::less<>> users_;
  std::map<std::string, std::string, std::less<>> byFingerprint_;  ///< the names of users
  std::map<std::string, std::string, std::less<>> bySubject_;
};

}  // namespace zorva::access
