#include "cli/operations/ServerUrl.h"

#include <sys/un.h>

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <optional>

#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

/// The text may contain a password, so it is not repeated.
Failure wrongUrl(const std::string& why, const std::string& hint =
                                             "it looks like https://USER@HOST:5989/root/cimv2, "
                                             "http://localhost:5988/root/cimv2 or unix:") {
  return {ExitCode::WrongUsage, "--url: " + why, hint};
}

constexpr std::size_t kLongestUser = 256;

bool isHostCharacter(char c) noexcept {
  return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '.' || c == '-' || c == '_';
}

bool isAddressCharacter(char c) noexcept { return isHostCharacter(c) || c == ':' || c == '%'; }

bool isPort(std::string_view text) noexcept {
  unsigned port = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), port);
  return error == std::errc() && end == text.data() + text.size() && port > 0 && port <= 65535;
}

/// Splits "host", "host:port" or "[address]:port".
void readHost(std::string_view text, ServerUrl& url) {
  const bool isBracketed = text.starts_with('[');
  const std::size_t close = isBracketed ? text.find(']') : std::min(text.find(':'), text.size());
  if (close == std::string_view::npos) throw wrongUrl("the bracket of the address is not closed");
  const std::string_view host = text.substr(isBracketed ? 1 : 0, close - (isBracketed ? 1 : 0));
  const std::string_view rest = text.substr(close + (isBracketed ? 1 : 0));
  const bool isWell =
      !host.empty() && std::all_of(host.begin(), host.end(), isBracketed ? isAddressCharacter : isHostCharacter);
  if (!isWell) throw wrongUrl("'" + printable(host) + "' cannot be the name or address of a host");
  url.host = isBracketed ? "[" + std::string(host) + "]" : std::string(host);
  if (rest.empty()) return;
  if (!rest.starts_with(':') || !isPort(rest.substr(1))) {
    throw wrongUrl("'" + printable(rest) + "' after the host is no port");
  }
  url.port = rest.substr(1);
}

/// The byte of two hexadecimal digits.
std::optional<char> byteOf(std::string_view digits) noexcept {
  unsigned value = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), value, 16);
  if (digits.size() != 2 || error != std::errc() || end != digits.data() + digits.size()) return std::nullopt;
  return static_cast<char>(value);
}

/// The user before the "@".
std::string readUser(std::string_view text) {
  if (text.find(':') != std::string_view::npos) {
    throw wrongUrl("a password in a URL is not taken: everybody on this host sees it in the list of processes",
                   "give the user alone, https://USER@HOST; the password is asked for, or read from a file: "
                   "--password-file FILE");
  }
  std::string user;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const std::optional<char> byte = text[i] == '%' ? byteOf(text.substr(i + 1, 2)) : text[i];
    // HTTP Basic ends the user at a colon (RFC 7617).
    const bool isWell =
        byte && *byte != ':' && *byte != '/' && *byte != '\x7F' && static_cast<unsigned char>(*byte) >= ' ';
    if (!isWell) throw wrongUrl("the text before the '@' cannot be a user");
    user += *byte;
    if (text[i] == '%') i += 2;
  }
  if (user.empty() || user.size() > kLongestUser) throw wrongUrl("the text before the '@' cannot be a user");
  return user;
}

std::string readNameSpace(std::string_view text) {
  while (text.starts_with('/')) text.remove_prefix(1);
  while (text.ends_with('/')) text.remove_suffix(1);
  const auto isWell = [](char c) { return isHostCharacter(c) || c == '/' || static_cast<unsigned char>(c) >= 0x80; };
  if (!std::all_of(text.begin(), text.end(), isWell)) throw wrongUrl("'" + printable(text) + "' cannot be a namespace");
  return text.empty() ? kUsualNameSpace : std::string(text);
}

/// The text after "unix:".
ServerUrl readSocket(std::string_view text) {
  ServerUrl url;
  url.scheme = "unix";
  const std::size_t hash = std::min(text.find('#'), text.size());
  url.socket = std::string(text.substr(0, hash));
  url.nameSpace = readNameSpace(text.substr(std::min(hash + 1, text.size())));
  if (url.socket.empty()) url.socket = usualSocket();
  if (!url.socket.starts_with('/')) throw wrongUrl("the path of a socket begins with '/'", "it looks like unix:/PATH");
  if (url.socket.size() >= sizeof(sockaddr_un::sun_path)) throw wrongUrl("the path of the socket is too long");
  return url;
}

}  // namespace

std::string usualSocket() {
  const char* given = std::getenv("ZORVACTL_SOCKET");
  return given == nullptr || *given == '\0' ? "/run/zorvacimd/cim.sock" : given;
}

ServerUrl readServerUrl(std::string_view text) {
  if (text.starts_with("unix:")) return readSocket(text.substr(5));
  ServerUrl url;
  const std::size_t colon = text.find("://");
  url.scheme = std::string(text.substr(0, colon));
  std::transform(url.scheme.begin(), url.scheme.end(), url.scheme.begin(), util::lowerAscii);
  if (colon == std::string_view::npos || (url.scheme != "http" && url.scheme != "https")) {
    throw wrongUrl("it begins neither with https:// nor with http:// nor with unix:");
  }
  std::string_view rest = text.substr(colon + 3);
  // Before all else, so that no other message shows a part of a password.
  if (const std::size_t at = rest.rfind('@'); at != std::string_view::npos) {
    url.user = readUser(rest.substr(0, at));
    rest.remove_prefix(at + 1);
  }
  if (!url.user.empty() && !url.isEncrypted()) {
    throw wrongUrl("a login needs https: over http the password would be readable on the way");
  }
  const std::size_t slash = std::min(rest.find('/'), rest.size());
  // The usual ports of CIM-XML (IANA: wbem-http, wbem-https).
  url.port = url.isEncrypted() ? "5989" : "5988";
  readHost(rest.substr(0, slash), url);
  url.nameSpace = readNameSpace(rest.substr(slash));
  return url;
}

}  // namespace zorva::cli
