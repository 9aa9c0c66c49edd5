#include "agent/apply/WantedSettings.h"

#include <algorithm>
#include <cerrno>
#include <string_view>
#include <utility>

#include "agent/files/KeyValues.h"
#include "agent/files/SettingFiles.h"
#include "agent/sources/DnsFacts.h"
#include "agent/tree/IpAddress.h"
#include "agent/tree/TreeJson.h"
#include "util/Escape.h"
#include "util/Names.h"
#include "util/ReadFile.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using util::sameName;

constexpr std::size_t kIPv4Size = 4;

StringList splitAtBlanks(std::string_view text) {
  StringList words;
  while (!text.empty()) {
    const std::string_view word = text.substr(0, text.find(' '));
    if (!word.empty()) words.emplace_back(word);
    text.remove_prefix(std::min(word.size() + 1, text.size()));
  }
  return words;
}

template <typename Value>
void takeFirst(std::optional<Value>& wanted, Value value) {
  if (!wanted.has_value()) wanted = std::move(value);
}

void takeOverlay(WantedSettings& wanted, PropertyNumber number, const PropertyValue& value) {
  if (!canBeSet(number, value)) return;
  if (number == PROP_DNS_SERVER_ADDRESSES) takeFirst(wanted.servers, *std::get<SharedStrings>(value));
  if (number == PROP_DNS_SUFFIXES) takeFirst(wanted.suffixes, *std::get<SharedStrings>(value));
  if (number == PROP_DOMAIN_NAME) takeFirst(wanted.domain, std::get<std::string>(value));
}

bool isMulticast(const std::vector<unsigned char>& address) {
  constexpr unsigned char kFirstOfIPv4 = 224;  // what is above is multicast, reserved, or the broadcast address
  constexpr unsigned char kOfIPv6 = 0xFF;
  return address.size() == kIPv4Size ? address.front() >= kFirstOfIPv4 : address.front() == kOfIPv6;
}

bool isUnspecified(const std::vector<unsigned char>& address) {
  if (address.size() == kIPv4Size) return address.front() == 0;
  return isUnspecifiedAddress(address);
}

// An IPv4 address in an IPv6 address is judged as what it is.
std::vector<unsigned char> withoutMapping(const std::vector<unsigned char>& address) {
  const std::vector<unsigned char> prefix{0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xFF, 0xFF};
  if (address.size() <= prefix.size() || !std::equal(prefix.begin(), prefix.end(), address.begin())) return address;
  return {address.end() - kIPv4Size, address.end()};
}

// Why a value is refused; empty where it is not. A value that is not refused gets its usual form.
std::string settleServer(std::string& server, const std::string& interface) {
  const std::size_t zone = std::min(server.find('%'), server.size());
  const std::vector<unsigned char> address = bytesOfAddress(server.substr(0, zone));
  if (address.empty()) return "is no IP address";
  if (isUnspecified(withoutMapping(address))) return "is no address of a host";
  if (isMulticast(withoutMapping(address))) return "is no unicast address";
  std::string usual = textOfAddress(address);
  const std::string own = '%' + interface;
  if (zone < server.size() && !isIPv6LinkLocal(usual)) return "has a zone, which only link-local addresses have";
  if (zone < server.size() && server.substr(zone) != own) return "has another zone than the interface";
  if (isIPv6LinkLocal(usual)) usual += own;
  server = usual;
  return {};
}

std::string settleName(std::string& name, const std::string&) {
  const auto isNameLetter = [](char letter) {
    return (letter >= '0' && letter <= '9') || (util::lowerAscii(letter) >= 'a' && util::lowerAscii(letter) <= 'z') ||
           letter == '-' || letter == '_' || letter == '.';
  };
  if (name == "." || !isDomain(name) || !std::all_of(name.begin(), name.end(), isNameLetter)) return "is no DNS name";
  if (name.ends_with('.')) name.pop_back();
  return {};
}

using Settle = std::string (*)(std::string& value, const std::string& interface);

// The problem of a list, empty where it has none.
std::string settleList(std::optional<StringList>& list, PropertyNumber property, Settle settle,
                       const std::string& interface) {
  if (!list.has_value()) return {};
  const std::string name = propertyName(property);
  if (list->size() > kMostApplied) {
    return name + ": there are " + std::to_string(list->size()) + " values, and " + std::to_string(kMostApplied) +
           " at most can be applied";
  }
  StringList settled;
  for (std::string value : *list) {
    std::string problem = name + ": '";
    util::appendEscaped(problem, value);
    if (const std::string reason = settle(value, interface); !reason.empty())
      return problem.append("' ").append(reason);
    const auto isSame = [&](const std::string& other) { return sameName(other, value); };
    if (std::none_of(settled.begin(), settled.end(), isSame)) settled.push_back(value);
  }
  list = std::move(settled);
  return {};
}

}  // namespace

std::string settingsFileOf(const std::string& dataDir, const std::string& interface) {
  return dataDir + settingFileName(interface);
}

Expected<WantedSettings, std::string> readWanted(const std::string& dataDir, const std::string& interface,
                                                 const OverlayValues& overlay, const std::string& path) {
  WantedSettings wanted;
  const std::string file = settingsFileOf(dataDir, interface);
  const int error =
      interface.empty() ? ENOENT : readKeyValues(file, [&wanted](std::string_view key, std::string_view value) {
        if (key == "DNSSERVERS") takeFirst(wanted.servers, splitAtBlanks(value));
        if (key == "DNSSUFFIXES") takeFirst(wanted.suffixes, splitAtBlanks(value));
        if (key == "DOMAINNAME") takeFirst(wanted.domain, std::string(value));
      });
  if (error != 0 && error != ENOENT) return unexpected(file + ": cannot be read: " + util::fileErrorText(error));
  const auto values = overlay.find(path);
  if (values == overlay.end()) return wanted;
  for (const auto& [number, value] : values->second) takeOverlay(wanted, number, value);
  return wanted;
}

Expected<WantedSettings, std::string> checked(const WantedSettings& wanted, const std::string& interface) {
  WantedSettings result = wanted;
  std::optional<StringList> domain;
  if (wanted.domain.has_value() && !wanted.domain->empty()) domain = StringList{*wanted.domain};
  std::string problems;
  for (const std::string& problem : {settleList(result.servers, PROP_DNS_SERVER_ADDRESSES, settleServer, interface),
                                     settleList(result.suffixes, PROP_DNS_SUFFIXES, settleName, interface),
                                     settleList(domain, PROP_DOMAIN_NAME, settleName, interface)}) {
    if (!problem.empty()) problems += (problems.empty() ? "" : "; ") + problem;
  }
  if (!problems.empty()) return unexpected(std::move(problems));
  if (domain.has_value()) result.domain = domain->front();
  return result;
}

std::string textOf(const WantedSettings& wanted) {
  std::string text;
  const auto add = [&text](const char* name, const StringList& values) {
    text += name;
    for (const std::string& value : values) text += ' ' + value;
    text += ';';
  };
  if (wanted.servers.has_value()) add("servers", *wanted.servers);
  if (wanted.suffixes.has_value()) add("suffixes", *wanted.suffixes);
  if (wanted.domain.has_value()) add("domain", {*wanted.domain});
  return text;
}

StringList searchListOf(const StringList& suffixes, const std::string& domain, const std::string& ownDomain) {
  if (domain.empty() || (!suffixes.empty() && sameName(suffixes.front(), domain))) return suffixes;
  if (suffixes.empty() && sameName(domain, ownDomain)) return {};
  StringList list{domain};
  for (const std::string& suffix : suffixes) {
    if (!sameName(suffix, domain)) list.push_back(suffix);
  }
  return list;
}

}  // namespace zorva::agent
