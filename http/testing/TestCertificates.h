#pragma once

// For tests: an authority of the test's own, and the certificates that it issues.

#include <ctime>
#include <string>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"
#include "http/GnutlsHandles.h"

namespace zorva::http::testing {

struct Wanted {
  std::string subject = "localhost";               ///< the common name
  std::vector<std::string> names = {"localhost"};  ///< or IPv4 addresses
  bool forClient = false;
  std::time_t from = -3600;    ///< seconds from now
  std::time_t until = 864000;  ///< seconds from now
};

/// Files in PEM.
struct IssuedFiles {
  std::string certificate;
  std::string key;
};

class TestAuthority {
 public:
  /// Writes its certificate to `name`.crt in the directory.
  TestAuthority(const agent::testing::TemporaryDirectory& directory, const std::string& name);

  const std::string& file() const { return file_; }

  /// Writes `name`.crt and `name`.key (0640) in the directory.
  IssuedFiles issue(const std::string& name, const Wanted& wanted = {}) const;

 private:
  const agent::testing::TemporaryDirectory& directory_;
  X509Key key_;
  X509Certificate certificate_;
  std::string file_;
};

/// What a command prints on both outputs.
std::string outputOf(const std::string& command);

/// The SHA-256 fingerprint of a certificate in PEM, as the program openssl computes it: 64 lower-case hexadecimal
/// digits.
std::string fingerprintByOpenssl(const std::string& file);

}  // namespace zorva::http::testing
