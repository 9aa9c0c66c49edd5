#include "server/ConsolePages.h"

#include <span>
#include <stdexcept>
#include <string>
#include <utility>

#include "http/RequestHead.h"

namespace zorva::server {

namespace {

constexpr std::string_view kIndex = "index.html";

/// Nothing but the files of the console itself, and nobody may frame it.
constexpr const char* kPolicy =
    "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self'; connect-src 'self'; base-uri 'none'; "
    "form-action 'none'; frame-ancestors 'none'";

std::string_view typeOf(std::string_view name) {
  if (name.ends_with(".html")) return "text/html; charset=utf-8";
  if (name.ends_with(".css")) return "text/css; charset=utf-8";
  if (name.ends_with(".js")) return "text/javascript; charset=utf-8";
  if (name.ends_with(".svg")) return "image/svg+xml";
  throw std::logic_error("console/" + std::string(name) + " is of no known type");
}

std::span<const ConsoleFile> consoleFiles() { return {kConsoleFiles, kConsoleFileCount}; }

const ConsoleFile& indexFile() {
  for (const ConsoleFile& file : consoleFiles()) {
    if (file.name == kIndex) return file;
  }
  throw std::logic_error("console/index.html is missing");
}

/// A browser asks each time whether its copy is still good: after an update it must not mix old and new files.
http::HeaderList headersOf(const ConsoleFile& file) {
  return {{"Content-Type", std::string(typeOf(file.name))},
          {"ETag", "W/\"" + std::string(file.tag) + "\""},
          {"Cache-Control", "no-cache"},
          {"Content-Security-Policy", kPolicy},
          {"Cross-Origin-Opener-Policy", "same-origin"},
          {"Cross-Origin-Resource-Policy", "same-origin"},
          {"Referrer-Policy", "no-referrer"},
          {"X-Content-Type-Options", "nosniff"},
          {"Vary", "Accept"}};
}

void send(const ConsoleFile& file, const http::HttpRequest& request, http::ResponseSink& sink) {
  http::HeaderList headers = headersOf(file);
  const bool hasIt = http::listHas(request.headers, "If-None-Match", headers[1].second);
  sink.begin(hasIt ? 304 : 200, headers);
  if (!hasIt) sink.write(file.text);
}

}  // namespace

void addConsole(http::Pages& pages) {
  for (const ConsoleFile& file : consoleFiles()) {
    const auto answer = [&file](const http::HttpRequest& request, http::ResponseSink& sink) {
      send(file, request, sink);
    };
    pages["/console/" + std::string(file.name)] = {answer, true};
  }
  const auto text = pages["/"].answer;
  pages["/"] = {[text](const http::HttpRequest& request, http::ResponseSink& sink) {
                  const bool isBrowser = http::listHas(request.headers, "Accept", "text/html");
                  isBrowser || !text ? send(indexFile(), request, sink) : text(request, sink);
                },
                true};
}

}  // namespace zorva::server
