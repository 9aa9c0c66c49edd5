#pragma once

// What the command line says about the CIM servers to ask.

#include <chrono>
#include <optional>
#include <string>
#include <vector>

namespace zorva::cli {

struct ServerOptions {
  std::vector<std::string> urls;
  std::string hostsFile;     ///< names a host on each line
  std::string user;          ///< who logs in where a URL names nobody
  std::string caFile;        ///< see Trust
  std::string fingerprint;   ///< see Trust, in any usual spelling
  std::string passwordFile;  ///< "-": standard input
  std::optional<std::chrono::milliseconds> timeout;
  bool yes = false;  ///< changes on several hosts need no question

  bool any() const noexcept { return !urls.empty() || !hostsFile.empty(); }

  /// Whether the results are those of several hosts: then each says of which.
  bool many() const noexcept { return urls.size() > 1 || !hostsFile.empty(); }
};

}  // namespace zorva::cli
