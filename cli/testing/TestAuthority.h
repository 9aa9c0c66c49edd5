#pragma once

// For tests: a certificate authority of their own.

#include <chrono>
#include <string>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::cli {

struct TestCertificate {
  std::string certificate;  ///< PEM
  std::string key;          ///< PEM
  std::string fingerprint;  ///< SHA-256: 64 lower-case hexadecimal digits
};

/// The age of a certificate: valid, or not any more.
enum class Validity { Now, Past };

/// A certificate with an ECDSA P-256 key for these names and IP addresses, signed by `issuer`; null: by itself.
TestCertificate makeCertificate(const std::vector<std::string>& names, const TestCertificate* issuer = nullptr,
                                Validity validity = Validity::Now);

/// An authority, which signs others.
TestCertificate makeAuthority(const std::string& name);

}  // namespace zorva::cli
