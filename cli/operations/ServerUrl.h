#pragma once

// The address of a CIM server in the form of --url: https://user@host:port/namespace, or unix:/path#namespace.

#include <string>
#include <string_view>

namespace zorva::cli {

inline constexpr const char* kUsualNameSpace = "root/cimv2";

struct ServerUrl {
  std::string scheme;     ///< "http", "https" or "unix"
  std::string user;       ///< who logs in, decoded; empty: nobody. Only with https
  std::string host;       ///< a name, or an address; an IPv6 one in brackets; empty with a socket
  std::string port;       ///< if empty in the URL, the usual port of CIM-XML
  std::string socket;     ///< the path of a Unix socket
  std::string nameSpace;  ///< kUsualNameSpace if the URL has none

  bool isEncrypted() const noexcept { return scheme == "https"; }
  bool isSocket() const noexcept { return scheme == "unix"; }

  /// The address of requests: DSP0200 leaves their path to the server, and servers accept /cimom.
  std::string endpoint() const { return isSocket() ? "http://localhost/cimom" : shown() + "/cimom"; }

  /// The server for messages, without the user.
  std::string shown() const { return isSocket() ? "unix:" + socket : scheme + "://" + host + ":" + port; }
};

/// The socket of zorvacimd on this host: $ZORVACTL_SOCKET, else the usual one.
std::string usualSocket();

/// Throws Failure (wrong usage) that says what is wrong with the text. It refuses a password, which everybody sees in
/// the list of processes, and a user without encryption.
ServerUrl readServerUrl(std::string_view text);

}  // namespace zorva::cli
