#include "agent/sources/NetworkManagerValues.h"

#include <cstdint>

#include "agent/tree/IpAddress.h"

namespace zorva::agent {

void ifTexts(BusReader& reader, StringList& texts) {
  reader.ifVariant("as", [&] {
    texts.clear();
    reader.forEach("s", [&] { texts.push_back(reader.text()); });
  });
}

void ifAddressBytes(BusReader& reader, StringList& addresses) {
  reader.ifVariant("aay", [&] {
    addresses.clear();
    reader.forEach("ay", [&] { addresses.push_back(textOfAddress(reader.bytes())); });
  });
}

void ifAddressNumbers(BusReader& reader, StringList& addresses) {
  reader.ifVariant("au", [&] {
    addresses.clear();
    reader.forEach("u", [&] {
      const std::uint32_t number = reader.number();
      const auto* bytes = reinterpret_cast<const unsigned char*>(&number);
      addresses.push_back(textOfAddress({bytes, bytes + sizeof number}));
    });
  });
}

}  // namespace zorva::agent
