#pragma once

// For tests: an authority of the test's own, and the certificates that it issues.

#include <gnutls/x509.h>

#include <ctime>
#include <memory>
#include <string>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::http::testing {

struct Wanted {
  std::string subject = "localhost";  ///< the common name
  std::vector<std::string> names = {"localhost"};
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
  struct Free {
    void operator()(gnutls_x509_crt_int* certificate) const { gnutls_x509_crt_deinit(certificate); }
    void operator()(gnutls_x509_privkey_int* key) const { gnutls_x509_privkey_deinit(key); }
  };
  using Certificate = std::unique_ptr<gnutls_x509_crt_int, Free>;
  using Key = std::unique_ptr<gnutls_x509_privkey_int, Free>;

  static Key newKey();
  static Certificate newCertificate(const Wanted& wanted, const Key& key, int serial);

  const agent::testing::TemporaryDirectory& directory_;
  Key key_;
  Certificate certificate_;
  std::string file_;
};

/// What a command prints on both outputs.
std::string outputOf(const std::string& command);

/// The SHA-256 fingerprint of a certificate in PEM, as the program openssl computes it: 64 lower-case hexadecimal
/// digits.
std::string fingerprintByOpenssl(const std::string& file);

}  // namespace zorva::http::testing
