// Any bytes as the text of an object path. If they are accepted, the path can be written and read back unchanged.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "broker/objects/PathText.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const auto path = zorva::broker::parsePathText(text);
  if (!path) {
    if (path.error().message.empty() || path.error().position > size) std::abort();
    return 0;
  }
  const std::string first = zorva::broker::pathText(*path);
  if (first.size() > zorva::broker::kMaxPathText) return 0;  // escapes may have made it too long
  const auto again = zorva::broker::parsePathText(first);
  if (!again) {
    const auto& error = again.error();
    std::fprintf(stderr, "%s at byte %zu: %s\n", error.message.c_str(), error.position, first.c_str());
    std::abort();
  }
  if (zorva::broker::pathText(*again) != first) {
    std::fprintf(stderr, "%s\n%s\n", first.c_str(), zorva::broker::pathText(*again).c_str());
    std::abort();
  }
  return 0;
}
