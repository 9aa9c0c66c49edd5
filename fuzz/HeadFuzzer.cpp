// Any bytes as the head of a request: first its line, then its header fields. What is let through must have one method,
// one length and no control characters, and a refusal must say why.

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "cimom/ServiceHeaders.h"
#include "http/RequestHead.h"

namespace {

using namespace zorva;  // NOLINT(google-build-using-namespace)

[[noreturn]] void fail(const char* what, std::string_view text) {
  std::fprintf(stderr, "%s:\n%.*s\n", what, static_cast<int>(text.size()), text.data());
  std::abort();
}

std::string_view takeUntil(std::string_view& text, char end) {
  const std::size_t place = std::min(text.find(end), text.size());
  const std::string_view piece = text.substr(0, place);
  text.remove_prefix(std::min(place + 1, text.size()));
  return piece;
}

std::size_t countOf(const http::HeaderList& headers, std::string_view name) {
  return static_cast<std::size_t>(std::count_if(headers.begin(), headers.end(),
                                                [&](const auto& field) { return util::sameName(field.first, name); }));
}

void checkAdmitted(const http::HttpRequest& request, std::string_view text) {
  if (http::allowedMethods(true).find(request.method) == std::string_view::npos) {
    fail("a method that nobody answers was let through", text);
  }
  if (countOf(request.headers, "Content-Length") + countOf(request.headers, "Transfer-Encoding") > 1) {
    fail("a request with two lengths was let through", text);
  }
  for (const auto& [name, value] : request.headers) {
    if (name.empty() || value.find('\r') != std::string::npos || value.find('\0') != std::string::npos) {
      fail("a malformed field was let through", text);
    }
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  std::string_view rest = text;
  std::string_view line = takeUntil(rest, '\n');
  http::HttpRequest request;
  request.method = takeUntil(line, ' ');
  request.path = takeUntil(line, ' ');
  const std::string version(line);
  while (!rest.empty()) {
    std::string_view field = takeUntil(rest, '\n');
    const std::string name(takeUntil(field, ':'));
    request.headers.emplace_back(name, std::string(field));
  }
  constexpr std::size_t kMostBody = 1U << 20;
  const auto refusal = http::checkHead({request.method, request.path, version, request.headers, true}, kMostBody);
  if (refusal && (refusal->status < 400 || refusal->status > 599 || refusal->why.empty())) {
    fail("a refusal without a reason", text);
  }
  if (!refusal) checkAdmitted(request, text);
  const auto fields = cimom::readHeaders(request);
  if (!fields && fields.error().message.empty()) fail("a refusal of CIM fields without a reason", text);
  return 0;
}
