#pragma once

// Checks a request before its body is read: RFC 9110, RFC 9112, and clause 7 of DSP0200 1.4 (CIM operations over HTTP).
// Pure functions.

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "http/Exchange.h"

namespace zorva::http {

/// The first line and the header fields.
struct RequestHead {
  std::string_view method;
  std::string_view path;
  std::string_view version;  ///< "HTTP/1.1"
  const HeaderList& headers;
  bool hasPage = false;  ///< the path has a page, which GET and HEAD return
};

/// A response that needs no CIM operation.
struct Refusal {
  int status = 400;
  std::string why;            ///< a sentence for the client's user and for the log
  std::string_view cimError;  ///< value of the header CIMError (DSP0200 7.3.3); empty: none
  std::string_view allow{};   ///< value of the header Allow; empty: none
  std::string_view login{};   ///< value of the header WWW-Authenticate; empty: none
  int retrySeconds = 1;       ///< value of the header Retry-After, for status 503
};

/// Whether the request may go on to its body. Requests that are answered without a body may: OPTIONS, and GET and HEAD
/// of a page.
///
/// Whatever two readers could understand differently is refused, because one of them might be a proxy: Content-Length
/// or Transfer-Encoding twice or together, codings after or instead of "chunked", invalid characters in names.
std::optional<Refusal> checkHead(const RequestHead& head, std::size_t mostBodyBytes);

/// The value of the first field of that name; null if there is none.
const std::string* findHeader(const HeaderList& headers, std::string_view name);

/// Whether a list such as that of TE or Accept-Encoding has that word, with a weight above 0 (RFC 9110 12.4.2).
bool listHas(const HeaderList& headers, std::string_view name, std::string_view word);

/// The methods of a path, as the header Allow lists them.
std::string_view allowedMethods(bool hasPage);

/// True for GET and HEAD.
bool isForPages(std::string_view method);

/// The response to OPTIONS: the server's capabilities (DSP0200 7.5).
HeaderList capabilities(bool hasPage);

}  // namespace zorva::http
