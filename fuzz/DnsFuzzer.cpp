// Any bytes as the response of a DNS server. They are read or refused with a reason, in time that grows with them.

#include <cstdint>
#include <cstdlib>
#include <string_view>

#include "dns/Message.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view message(reinterpret_cast<const char*>(data), size);
  const auto response = zorva::dns::decodeResponse(message, 0x1234, {"example.org", zorva::dns::Type::A});
  // A record has eleven bytes at least.
  if (response ? response->answers > size / 11 : response.error().what.empty()) std::abort();
  return 0;
}
