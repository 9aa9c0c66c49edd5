#pragma once

#include "server/Config.h"

namespace zorva::server {

/// zorvacimd --make-certificate: writes a self-signed certificate and its key into the files that [tls] names, or into
/// the usual ones, and prints its fingerprint and what to do next. Throws std::runtime_error with a sentence.
void makeCertificate(const Config& config);

}  // namespace zorva::server
