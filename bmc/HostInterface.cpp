#include "bmc/HostInterface.h"

#include <cstdint>
#include <vector>

#include "agent/tree/IpAddress.h"
#include "util/ReadFile.h"

namespace zorva::bmc {

namespace {

constexpr std::size_t kLargestTable = std::size_t{4} << 20;

std::uint8_t byteAt(std::string_view bytes, std::size_t place) { return static_cast<std::uint8_t>(bytes[place]); }

/// Takes the first structure off the table: its formatted area. The texts after it end in two NULs. Empty at the end.
std::string_view takeStructure(std::string_view& table) {
  constexpr std::size_t kHeader = 4;
  if (table.size() < kHeader) return {};
  const std::size_t length = byteAt(table, 1);
  if (length < kHeader || length > table.size()) return {};
  const std::string_view structure = table.substr(0, length);
  const std::size_t end = table.find(std::string_view("\0\0", 2), length);
  table = end == std::string_view::npos ? std::string_view() : table.substr(end + 2);
  return structure;
}

/// The record of the protocol "Redfish over IP" (DSP0270, "Protocol Specific Record Data").
std::optional<std::string> urlIn(std::string_view record) {
  constexpr std::size_t kFormat = 51;
  constexpr std::size_t kAddress = 52;
  constexpr std::size_t kPort = 84;
  constexpr std::size_t kShortest = 91;
  constexpr std::uint8_t kIPv4 = 1;
  constexpr std::uint8_t kIPv6 = 2;
  if (record.size() < kShortest) return std::nullopt;
  const std::uint8_t format = byteAt(record, kFormat);
  if (format != kIPv4 && format != kIPv6) return std::nullopt;
  const std::string_view field = record.substr(kAddress, format == kIPv4 ? 4 : 16);
  const std::vector<unsigned char> address(field.begin(), field.end());
  const int port = byteAt(record, kPort) + byteAt(record, kPort + 1) * 256;
  if (agent::isUnspecifiedAddress(address) || port == 0) return std::nullopt;
  const std::string text = agent::textOfAddress(address);
  return "https://" + (format == kIPv4 ? text : "[" + text + "]") + ":" + std::to_string(port);
}

/// Of a structure of type 42: the data of the interface, then records of protocols.
std::optional<std::string> urlOfController(std::string_view structure) {
  constexpr std::size_t kInterfaceType = 4;
  constexpr std::size_t kInterfaceData = 6;
  constexpr std::uint8_t kNetworkHostInterface = 0x40;
  constexpr std::uint8_t kRedfishOverIp = 4;
  if (structure.size() <= kInterfaceData || byteAt(structure, kInterfaceType) != kNetworkHostInterface) return {};
  const std::size_t records = kInterfaceData + byteAt(structure, kInterfaceType + 1);
  if (records >= structure.size()) return std::nullopt;
  std::size_t left = byteAt(structure, records);
  std::string_view rest = structure.substr(records + 1);
  for (; left > 0 && rest.size() >= 2; --left) {
    const std::size_t length = byteAt(rest, 1);
    if (rest.size() < 2 + length) return std::nullopt;
    if (byteAt(rest, 0) == kRedfishOverIp) {
      if (auto url = urlIn(rest.substr(2, length))) return url;
    }
    rest.remove_prefix(2 + length);
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::string> findHostInterface(std::string_view table) {
  constexpr std::uint8_t kController = 42;
  constexpr std::uint8_t kEnd = 127;
  for (std::string_view each = takeStructure(table); !each.empty(); each = takeStructure(table)) {
    if (byteAt(each, 0) == kEnd) return std::nullopt;
    if (byteAt(each, 0) != kController) continue;
    if (auto url = urlOfController(each)) return url;
  }
  return std::nullopt;
}

std::optional<std::string> readHostInterface(const std::string& path) {
  const util::FileText file = util::readFile(path, kLargestTable);
  return file.error == 0 ? findHostInterface(file.text) : std::nullopt;
}

}  // namespace zorva::bmc
