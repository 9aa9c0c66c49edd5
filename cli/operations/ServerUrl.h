#pragma once

#include <string>
#include <string_view>

// Where a CIM server is, as --url says it: http://host:port/namespace.

namespace zorva::cli {

struct ServerUrl {
  std::string scheme;     ///< "http" or "https"
  std::string login;      ///< "user" or "user:password", as in the URL; empty: none
  std::string host;       ///< a name, or an address; an IPv6 one in brackets
  std::string port;       ///< empty in the URL: the usual port of CIM-XML
  std::string nameSpace;  ///< "root/cimv2" where the URL has none

  /// Where requests go: DSP0200 leaves the path to the server, and /cimom is what servers take.
  std::string endpoint() const {
    return scheme + "://" + (login.empty() ? "" : login + "@") + host + ":" + port + "/cimom";
  }

  /// The server for a person, without the login.
  std::string shown() const { return scheme + "://" + host + ":" + port; }
};

/// Throws Failure (wrong usage) that says what is wrong with the text.
ServerUrl readServerUrl(std::string_view text);

}  // namespace zorva::cli
