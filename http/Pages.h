#pragma once

// What GET and HEAD return, by path. CIM operations come by POST and have no page.

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "http/Exchange.h"
#include "http/RequestHead.h"

namespace zorva::http {

struct Page {
  /// Answers GET and HEAD, of which the body is not sent. It changes nothing.
  std::function<void(const HttpRequest&, ResponseSink&)> answer;

  /// Shown to everybody: nobody asks who the client is, and the thread of the connection answers, so it must not wait.
  /// Any other page is for clients that the gate lets in, whom HttpRequest::who names, and is answered by a worker.
  bool isPublic = false;

  /// Instead of `answer`: the response to GET, which the function keeps. It needs no worker meanwhile. Called on the
  /// thread of the connection, so it must not wait. Returns a refusal if the client does not get it.
  std::function<std::optional<Refusal>(const HttpRequest&, const std::shared_ptr<Stream>&)> stream = {};
};

/// By path, without a query.
using Pages = std::map<std::string, Page, std::less<>>;

/// The page of a path, whose query does not count; null if there is none.
const Page* pageAt(const Pages& pages, std::string_view path);

/// A public page with a fixed text.
Page textPage(std::string text);

}  // namespace zorva::http
