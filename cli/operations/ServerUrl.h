#pragma once

// The address of a CIM server in the form of --url: http://host:port/namespace.

#include <string>
#include <string_view>

namespace zorva::cli {

struct ServerUrl {
  std::string scheme;     ///< "http" or "https"
  std::string login;      ///< "user" or "user:password", as in the URL; empty: none
  std::string host;       ///< a name, or an address; an IPv6 one in brackets
  std::string port;       ///< if empty in the URL, the usual port of CIM-XML
  std::string nameSpace;  ///< "root/cimv2" if the URL has none

  /// The path of requests: DSP0200 leaves it to the server, and servers accept /cimom.
  std::string endpoint() const {
    return scheme + "://" + (login.empty() ? "" : login + "@") + host + ":" + port + "/cimom";
  }

  /// The server for messages, without the login.
  std::string shown() const { return scheme + "://" + host + ":" + port; }
};

/// Throws Failure (wrong usage) that says what is wrong with the text.
ServerUrl readServerUrl(std::string_view text);

}  // namespace zorva::cli
