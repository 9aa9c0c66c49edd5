#include "http/RequestHead.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <vector>

#include "util/Names.h"
#include "util/Text.h"

namespace zorva::http {

namespace {

constexpr std::string_view kHeaderMismatch = "header-mismatch";
constexpr std::string_view kNotValid = "request-not-valid";

/// The pieces between commas or semicolons, without surrounding blanks; empty ones are left out. A separator within
/// quotes does not count.
std::vector<std::string_view> split(std::string_view text, char separator) {
  std::vector<std::string_view> pieces;
  bool quoted = false;
  std::size_t begin = 0;
  for (std::size_t i = 0; i <= text.size(); ++i) {
    if (i < text.size() && text[i] == '"') quoted = !quoted;
    if (i < text.size() && (quoted || text[i] != separator)) continue;
    if (const std::string_view piece = util::trimmed(text.substr(begin, i - begin)); !piece.empty())
      pieces.push_back(piece);
    begin = i + 1;
  }
  return pieces;
}

bool isTokenCharacter(char c) {
  const bool letter = util::lowerAscii(c) >= 'a' && util::lowerAscii(c) <= 'z';
  return letter || (c >= '0' && c <= '9') || std::string_view("!#$%&'*+-.^_`|~").find(c) != std::string_view::npos;
}

bool isToken(std::string_view text) { return !text.empty() && std::all_of(text.begin(), text.end(), isTokenCharacter); }

bool isFieldText(std::string_view text) {
  return std::none_of(text.begin(), text.end(),
                      [](char c) { return (static_cast<unsigned char>(c) < 0x20 && c != '\t') || c == 0x7F; });
}

Refusal bad(std::string why, std::string_view cimError = kNotValid) { return {400, std::move(why), cimError}; }

/// A CIM header's name without the prefix of an extension (DSP0200 7.2: "73-CIMOperation").
std::string_view withoutPrefix(std::string_view name) {
  const bool prefixed = name.size() > 3 && name[0] >= '0' && name[0] <= '9' && name[1] >= '0' && name[1] <= '9';
  return prefixed && name[2] == '-' ? name.substr(3) : name;
}

/// Header fields that a request may have at most once: those that decide how it is read, and those of CIM.
bool isSingle(std::string_view name) {
  constexpr std::string_view kSingle[] = {"Host", "Content-Length", "Transfer-Encoding", "Content-Type",
                                          "Man",  "Authorization",  "Content-Encoding",  "Origin"};
  return std::any_of(std::begin(kSingle), std::end(kSingle), [&](auto each) { return util::sameName(each, name); }) ||
         util::sameName(name.substr(0, 3), "CIM");
}

std::optional<Refusal> checkFields(const HeaderList& headers) {
  for (std::size_t i = 0; i < headers.size(); ++i) {
    const auto& [name, value] = headers[i];
    if (!isToken(name)) return bad("a header field's name has a character that no name has");
    if (!isFieldText(value)) return bad("the header field " + name + " has a control character");
    const std::string_view bare = withoutPrefix(name);
    if (!isSingle(bare)) continue;
    for (std::size_t k = 0; k < i; ++k) {
      if (!util::sameName(withoutPrefix(headers[k].first), bare)) continue;
      const bool isCim = util::sameName(bare.substr(0, 3), "CIM") || util::sameName(bare, "Man");
      return bad("the header field " + std::string(bare) + " is given twice", isCim ? kHeaderMismatch : kNotValid);
    }
  }
  return std::nullopt;
}

/// How long the body is (RFC 9112 6.3).
std::optional<Refusal> checkFraming(const RequestHead& head, std::size_t most) {
  const std::string* length = findHeader(head.headers, "Content-Length");
  const std::string* coding = findHeader(head.headers, "Transfer-Encoding");
  if (length != nullptr && coding != nullptr) return bad("it has both Content-Length and Transfer-Encoding");
  if (coding != nullptr) {
    if (head.version != "HTTP/1.1") return bad("Transfer-Encoding belongs to HTTP/1.1");
    if (!util::sameName(*coding, "chunked")) return bad("the only Transfer-Encoding that this server takes is chunked");
  }
  if (length != nullptr) {
    std::uint64_t bytes = 0;
    const auto [end, error] = std::from_chars(length->data(), length->data() + length->size(), bytes);
    if (error == std::errc::result_out_of_range) return Refusal{413, "the body is too long", {}};
    if (error != std::errc() || end != length->data() + length->size()) return bad("Content-Length is no number");
    if (bytes > most) return Refusal{413, "the body is longer than the " + std::to_string(most) + " bytes allowed", {}};
  }
  return std::nullopt;
}

std::optional<Refusal> checkMethod(const RequestHead& head) {
  if (head.method == "POST" || head.method == "M-POST" || head.method == "OPTIONS") return std::nullopt;
  if (head.hasPage && isForPages(head.method)) return std::nullopt;
  constexpr std::string_view kKnown[] = {"GET", "HEAD", "PUT", "DELETE", "PATCH", "TRACE", "CONNECT"};
  if (std::find(std::begin(kKnown), std::end(kKnown), head.method) != std::end(kKnown)) {
    return Refusal{405,
                   "CIM operations come by POST or M-POST (DSP0200); a browser cannot show them",
                   {},
                   allowedMethods(head.hasPage)};
  }
  return Refusal{
      501, "there is no such method here; CIM operations come by POST or M-POST", {}, allowedMethods(head.hasPage)};
}

bool isUtf8Name(std::string_view charset) {
  if (charset.size() >= 2 && charset.front() == '"' && charset.back() == '"') {
    charset = charset.substr(1, charset.size() - 2);
  }
  return util::sameName(charset, "utf-8") || util::sameName(charset, "utf8") || util::sameName(charset, "us-ascii");
}

std::optional<Refusal> checkContent(const HeaderList& headers) {
  if (const std::string* coding = findHeader(headers, "Content-Encoding")) {
    if (!util::sameName(*coding, "identity")) return Refusal{415, "a request's body must not be encoded", {}};
  }
  const std::string* type = findHeader(headers, "Content-Type");
  if (type == nullptr) return std::nullopt;
  const auto parts = split(*type, ';');
  if (parts.empty() || !(util::sameName(parts[0], "application/xml") || util::sameName(parts[0], "text/xml"))) {
    return Refusal{415, "Content-Type must be application/xml or text/xml", {}};
  }
  for (std::size_t i = 1; i < parts.size(); ++i) {
    const std::size_t equals = parts[i].find('=');
    if (equals == std::string_view::npos || !util::sameName(util::trimmed(parts[i].substr(0, equals)), "charset"))
      continue;
    if (!isUtf8Name(util::trimmed(parts[i].substr(equals + 1)))) return bad("the charset of a request must be utf-8");
  }
  return std::nullopt;
}

/// Whether the client accepts the media type of the response.
std::optional<Refusal> checkAccept(const HeaderList& headers) {
  const auto takes = [&](std::string_view name, std::initializer_list<std::string_view> words) {
    return findHeader(headers, name) == nullptr ||
           std::any_of(words.begin(), words.end(), [&](auto word) { return listHas(headers, name, word); });
  };
  if (!takes("Accept", {"application/xml", "text/xml", "application/*", "text/*", "*/*"})) {
    return Refusal{406, "responses are application/xml, which Accept leaves out", {}};
  }
  if (!takes("Accept-Charset", {"utf-8", "*"})) {
    return Refusal{406, "responses are in utf-8, which Accept-Charset leaves out", {}};
  }
  return std::nullopt;
}

std::optional<Refusal> checkExpect(const HeaderList& headers) {
  for (const auto& [name, value] : headers) {
    if (util::sameName(name, "Expect") && !util::sameName(value, "100-continue")) {
      return Refusal{417, "this server knows no expectation but 100-continue", {}};
    }
  }
  return std::nullopt;
}

bool isZeroWeight(std::string_view parameter) {
  if (parameter.size() < 3 || util::lowerAscii(parameter[0]) != 'q' || parameter[1] != '=') return false;
  return parameter.substr(2).find_first_not_of("0.") == std::string_view::npos;
}

}  // namespace

const std::string* findHeader(const HeaderList& headers, std::string_view name) {
  for (const auto& [each, value] : headers) {
    if (util::sameName(each, name)) return &value;
  }
  return nullptr;
}

bool listHas(const HeaderList& headers, std::string_view name, std::string_view word) {
  for (const auto& [each, value] : headers) {
    if (!util::sameName(each, name)) continue;
    for (const std::string_view element : split(value, ',')) {
      const auto parts = split(element, ';');
      if (parts.empty() || !util::sameName(parts[0], word)) continue;
      return std::none_of(parts.begin() + 1, parts.end(), isZeroWeight);
    }
  }
  return false;
}

std::optional<Refusal> checkHead(const RequestHead& head, std::size_t mostBodyBytes) {
  if (auto refusal = checkFields(head.headers)) return refusal;
  if (auto refusal = checkFraming(head, mostBodyBytes)) return refusal;
  if (auto refusal = checkMethod(head)) return refusal;
  if (auto refusal = checkExpect(head.headers)) return refusal;
  if (head.method == "OPTIONS" || isForPages(head.method)) return std::nullopt;
  if (findHeader(head.headers, "Content-Length") == nullptr &&
      findHeader(head.headers, "Transfer-Encoding") == nullptr) {
    return Refusal{411, "a request needs a Content-Length, or a chunked body", {}};
  }
  if (auto refusal = checkContent(head.headers)) return refusal;
  return checkAccept(head.headers);
}

std::string_view allowedMethods(bool hasPage) {
  return hasPage ? "GET, HEAD, POST, M-POST, OPTIONS" : "POST, M-POST, OPTIONS";
}

bool isForPages(std::string_view method) { return method == "GET" || method == "HEAD"; }

HeaderList capabilities(bool hasPage) {
  // Qualifier types can be read but not changed, so their group is not included.
  return {{"Allow", std::string(allowedMethods(hasPage))},
          {"Opt", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=77"},
          {"77-CIMProtocolVersion", "1.4"},
          {"77-CIMSupportedFunctionalGroups", "basic-read, basic-write, instance-manipulation, association-traversal"},
          {"77-CIMSupportedMultipleOperations", ""},
          {"77-CIMValidation", "loosely-validating"}};
}

}  // namespace zorva::http
