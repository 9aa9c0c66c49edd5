#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "http/Exchange.h"

// What is asked of a request before its body is taken: RFC 9110, RFC 9112, and clause 7 of DSP0200 1.4 (CIM operations
// over HTTP). Pure functions.

namespace zorva::http {

/// The first line and the header fields.
struct RequestHead {
  std::string_view method;
  std::string_view path;
  std::string_view version;  ///< "HTTP/1.1"
  const HeaderList& headers;
};

/// An answer that needs no CIM.
struct Refusal {
  int status = 400;
  std::string why;            ///< a sentence for the person at the other end and for the log
  std::string_view cimError;  ///< value of the header CIMError (DSP0200 7.3.3); empty: none
  std::string_view allow{};   ///< value of the header Allow; empty: none
};

/// Whether the request may go on to its body. Those that are answered without one may: OPTIONS, and GET and HEAD of
/// "/".
///
/// Whatever two readers could take differently is refused, since one of them might be a proxy: Content-Length or
/// Transfer-Encoding twice or together, codings after or instead of "chunked", names with characters that no name has.
std::optional<Refusal> checkHead(const RequestHead& head, std::size_t mostBodyBytes);

/// The value of the first field of that name; null where there is none.
const std::string* findHeader(const HeaderList& headers, std::string_view name);

/// Whether a list such as that of TE or Accept-Encoding has that word, with a weight above 0 (RFC 9110 12.4.2).
bool listHas(const HeaderList& headers, std::string_view name, std::string_view word);

/// The methods that a path has, as the header Allow lists them. The root alone has a page for people.
std::string_view allowedMethods(std::string_view path);

/// True for GET and HEAD of the root: a person asks what this is.
bool asksForPage(std::string_view method, std::string_view path);

/// The answer to OPTIONS: what this server can do (DSP0200 7.5).
HeaderList capabilities(std::string_view path);

}  // namespace zorva::http
