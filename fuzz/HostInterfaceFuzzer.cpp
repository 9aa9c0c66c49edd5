// Any bytes as the firmware's table. What is found must be a URL of an address and a port.

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "bmc/HostInterface.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto url = zorva::bmc::findHostInterface({reinterpret_cast<const char*>(data), size});
  if (url &&
      (!url->starts_with("https://") || url->find_first_not_of("htps:/.[]0123456789abcdef") != std::string::npos)) {
    std::fprintf(stderr, "no URL: %s\n", url->c_str());
    std::abort();
  }
  return 0;
}
