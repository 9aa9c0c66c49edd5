#include "cli/operations/ServerUrl.h"

#include <algorithm>
#include <charconv>

#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

/// The text may contain a password, so it is not repeated.
Failure wrongUrl(const std::string& why) {
  return {ExitCode::WrongUsage, "--url: " + why, "it looks like http://localhost:5988/root/cimv2"};
}

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

}  // namespace

ServerUrl readServerUrl(std::string_view text) {
  ServerUrl url;
  const std::size_t colon = text.find("://");
  url.scheme = std::string(text.substr(0, colon));
  std::transform(url.scheme.begin(), url.scheme.end(), url.scheme.begin(), util::lowerAscii);
  if (colon == std::string_view::npos || (url.scheme != "http" && url.scheme != "https")) {
    throw wrongUrl("it begins neither with http:// nor with https://");
  }
  std::string_view rest = text.substr(colon + 3);
  const std::size_t slash = std::min(rest.find('/'), rest.size());
  std::string_view authority = rest.substr(0, slash);
  rest.remove_prefix(slash);
  // The usual ports of CIM-XML (IANA: wbem-http, wbem-https).
  url.port = url.scheme == "http" ? "5988" : "5989";
  if (const std::size_t at = authority.rfind('@'); at != std::string_view::npos) {
    url.login = authority.substr(0, at);
    authority.remove_prefix(at + 1);
  }
  readHost(authority, url);
  while (rest.starts_with('/')) rest.remove_prefix(1);
  while (rest.ends_with('/')) rest.remove_suffix(1);
  const auto isNameSpaceCharacter = [](char c) {
    return isHostCharacter(c) || c == '/' || static_cast<unsigned char>(c) >= 0x80;
  };
  if (!std::all_of(rest.begin(), rest.end(), isNameSpaceCharacter)) {
    throw wrongUrl("'" + printable(rest) + "' cannot be a namespace");
  }
  url.nameSpace = rest.empty() ? "root/cimv2" : std::string(rest);
  return url;
}

}  // namespace zorva::cli
