#pragma once

// The way in which a password is checked. The server's own way is the hash in the file of users.

#include <string>

#include "access/PasswordHash.h"
#include "access/Users.h"

namespace zorva::access {

class PasswordVerifier {
 public:
  virtual ~PasswordVerifier() = default;

  /// Whether it is the password of that user. `user` is the entry in the file of users, null if there is none; the
  /// answer must take the same time with and without one. Called on one thread at a time, which may wait.
  virtual bool verify(const std::string& name, const User* user, const std::string& password) = 0;
};

class HashVerifier final : public PasswordVerifier {
 public:
  bool verify(const std::string&, const User* user, const std::string& password) override {
    return isPasswordOf(password, user == nullptr ? std::string() : user->hash);
  }
};

}  // namespace zorva::access
