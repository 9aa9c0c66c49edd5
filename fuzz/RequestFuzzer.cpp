// Any bytes as the body of a request, through the whole server except HTTP and providers. The response must be XML that
// a client can read.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "cimom/Interop.h"
#include "cimom/Service.h"
#include "cimxml/RequestReader.h"
#include "cimxml/XmlCheck.h"
#include "schema/Schema.h"

namespace {

using namespace zorva;  // NOLINT(google-build-using-namespace)

[[noreturn]] void fail(const char* what, const std::string& text) {
  std::fprintf(stderr, "%s:\n%s\n", what, text.c_str());
  std::abort();
}

class Sink : public http::ResponseSink {
 public:
  void begin(int code, const http::HeaderList&) override { status = code; }
  void write(std::string_view piece) override { body += piece; }
  void fail(std::uint32_t, std::string_view) override { failed = true; }
  bool begun() const override { return status != 0; }

  int status = 0;
  bool failed = false;
  std::string body;
};

broker::BrokerOptions options() {
  broker::BrokerOptions made;
  made.providerDirectory = "/nonexistent";
  cimom::serveInterop(made);
  return made;
}

/// The header fields that a client would send with such a body.
http::HttpRequest requestOf(std::string body, const cimxml::CimRequest& read) {
  http::HttpRequest request{"POST", "/cimom", {{"CIMOperation", "MethodCall"}}, std::move(body), false};
  if (read.isMultiple || read.calls.empty() || read.calls.front().isExtrinsic) return request;
  request.headers.emplace_back("CIMMethod", read.calls.front().name);
  request.headers.emplace_back("CIMObject", read.calls.front().target.nameSpace);
  return request;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static broker::Broker broker(schema::loadBuiltInClasses(schema::ClassSet::Interop), options());
  static cimom::Service service(broker);
  std::string body(reinterpret_cast<const char*>(data), size);
  const auto read = cimxml::readRequest(body, {});
  if (!read) {
    if (read.error().message.empty()) fail("an error without a message", body);
    return 0;
  }
  Sink sink;
  service.handle(requestOf(std::move(body), *read), sink);
  if (!sink.begun()) fail("no response", sink.body);
  if (sink.status != 200 || sink.failed) return 0;
  const cimxml::XmlLimits kLimits{1000, 10'000'000};
  const auto checked = cimxml::checkXml(sink.body, kLimits);
  if (!checked) fail(checked.error().message.c_str(), sink.body);
  return 0;
}
