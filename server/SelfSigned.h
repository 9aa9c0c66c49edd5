#pragma once

// A certificate that the server signs itself, for hosts without a certificate authority.

#include <ctime>
#include <string>
#include <vector>

namespace zorva::server {

struct SelfSigned {
  std::string certificate;  ///< in PEM
  std::string key;          ///< in PEM
  std::string fingerprint;  ///< SHA-256: 64 lower-case hexadecimal digits
};

/// Makes a key (ECDSA P-256) and a certificate of a year for a server of these names and addresses; the first is its
/// subject. Throws std::runtime_error.
SelfSigned makeSelfSigned(const std::vector<std::string>& names, std::time_t now);

/// A file to be written.
struct NewFile {
  std::string path;
  std::string text;
  unsigned int mode = 0;
  std::string group;  ///< owns the file if there is such a group; empty: the process's own
};

/// Writes all of these files, each whole, or none of them. Replaces no file. Throws std::runtime_error with a sentence
/// that names the file.
void writeNewFiles(const std::vector<NewFile>& files);

}  // namespace zorva::server
