#pragma once

// A CIM server with all that is needed to speak with it.

#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include "cli/operations/ServerUrl.h"
#include "util/Secret.h"

namespace zorva::cli {

/// What a server's certificate must be. Only with https.
struct Trust {
  std::string caFile;  ///< PEM; it must be signed by one of these authorities; empty: by one that the system trusts
  std::string fingerprint;  ///< it must be the one with this SHA-256: 64 lower-case hexadecimal digits; empty: any
};

struct Server {
  ServerUrl url;
  Trust trust = {};
  std::shared_ptr<const util::Secret> password = nullptr;  ///< set if the URL has a user

  /// How long all operations together may take; nothing: only silence is limited.
  std::optional<std::chrono::milliseconds> patience = std::nullopt;
};

}  // namespace zorva::cli
