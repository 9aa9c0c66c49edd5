#include "http/Pages.h"

#include <utility>

namespace zorva::http {

const Page* pageAt(const Pages& pages, std::string_view path) {
  const auto found = pages.find(path.substr(0, path.find('?')));
  return found == pages.end() ? nullptr : &found->second;
}

Page textPage(std::string text) {
  return {[text = std::move(text)](const HttpRequest&, ResponseSink& sink) {
            sink.begin(200, {{"Content-Type", "text/plain; charset=utf-8"}});
            sink.write(text);
          },
          true,
          {}};
}

}  // namespace zorva::http
