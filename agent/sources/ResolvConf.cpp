#include "agent/sources/ResolvConf.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <optional>
#include <utility>

#include "agent/sources/DnsFacts.h"
#include "agent/tree/IpAddress.h"

namespace zorva::agent {
namespace {

constexpr std::string_view kBlanks = " \t";

// Up to the line feed; what follows a NUL is not seen by a resolver that is written in C.
std::string_view takeLineOfResolver(std::string_view& text) {
  const std::size_t end = text.find('\n');
  const std::string_view line = text.substr(0, end);
  text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
  return line.substr(0, line.find('\0'));
}

std::string_view takeWord(std::string_view& line) {
  line.remove_prefix(std::min(line.find_first_not_of(kBlanks), line.size()));
  const std::string_view word = line.substr(0, line.find_first_of(kBlanks));
  line.remove_prefix(word.size());
  return word;
}

// What follows the keyword, or nothing where the line has another one.
std::optional<std::string_view> valueOf(std::string_view keyword, std::string_view line) {
  if (!line.starts_with(keyword)) return std::nullopt;
  line.remove_prefix(keyword.size());
  if (line.empty() || kBlanks.find(line.front()) == std::string_view::npos) return std::nullopt;
  return line;
}

// The server's address in the usual form, empty where the word is none.
std::string serverIn(std::string_view word) {
  const std::string text(word);
  in_addr address{};
  // inet_aton passes over what follows white space.
  if (text.find_first_of("\r\v\f") == std::string::npos && ::inet_aton(text.c_str(), &address) != 0) {
    const auto* bytes = reinterpret_cast<const unsigned char*>(&address);
    return textOfAddress({bytes, bytes + sizeof address});
  }
  const std::size_t zone = std::min(text.find('%'), text.size());
  const std::string before = text.substr(0, zone);
  if (!isIPv6Address(before)) return {};
  const std::string canonical = textOfAddress(bytesOfAddress(before));
  const bool hasZone = zone + 1 < text.size() && isIPv6LinkLocal(canonical) && isShownText(text.substr(zone));
  return hasZone ? canonical + text.substr(zone) : canonical;
}

void addServer(ResolvConf& conf, std::string_view value) {
  const std::string server = serverIn(takeWord(value));
  if (server.empty()) return;
  StringList& list = conf.servers.size() < kMostAskedServers ? conf.servers : conf.notAsked;
  if (list.size() < kMostDnsValues) list.push_back(server);
}

// False where the line names no domain at all, and so does not count.
bool setSearch(ResolvConf& conf, std::string_view value, bool all) {
  StringList search;
  bool named = false;
  for (std::string_view word = takeWord(value); !word.empty(); word = takeWord(value)) {
    named = true;
    if (word != "." && isShownText(word) && search.size() < kMostDnsValues) search.emplace_back(word);
    if (!all) break;
  }
  if (!named) return false;
  conf.domain = all || search.empty() ? "" : search.front();
  conf.search = std::move(search);
  return true;
}

struct NumberOption {
  std::string_view prefix;
  long largest;
};

constexpr std::array kNumberOptions{NumberOption{"ndots:", 15}, NumberOption{"timeout:", 30},
                                    NumberOption{"attempts:", 5}};

// The first one that the word begins with is what the resolver takes it for.
constexpr std::array<std::string_view, 10> kFlagOptions{"rotate",         "edns0",        "single-request-reopen",
                                                        "single-request", "no_tld_query", "no-tld-query",
                                                        "no-reload",      "use-vc",       "trust-ad",
                                                        "no-aaaa"};

void addOption(StringList& options, std::string_view word) {
  for (const NumberOption& known : kNumberOptions) {
    if (!word.starts_with(known.prefix)) continue;
    // What is no number is 0 to the resolver. What a negative one means is not said anywhere.
    const long number = std::strtol(std::string(word.substr(known.prefix.size())).c_str(), nullptr, 10);
    if (number < 0) return;
    std::erase_if(options, [&](const std::string& other) { return other.starts_with(known.prefix); });
    options.push_back(std::string(known.prefix) + std::to_string(std::min(number, known.largest)));
    return;
  }
  for (const std::string_view known : kFlagOptions) {
    if (!word.starts_with(known)) continue;
    std::erase(options, known);
    options.emplace_back(known);
    return;
  }
}

}  // namespace

ResolvConf parseResolvConf(std::string_view text, std::string_view nodeName) {
  ResolvConf conf;
  bool hasSearch = false;
  while (!text.empty()) {
    const std::string_view line = takeLineOfResolver(text);
    if (const auto server = valueOf("nameserver", line)) {
      addServer(conf, *server);
    } else if (const auto domain = valueOf("domain", line)) {
      hasSearch = setSearch(conf, *domain, false) || hasSearch;
    } else if (const auto search = valueOf("search", line)) {
      hasSearch = setSearch(conf, *search, true) || hasSearch;
    } else if (auto options = valueOf("options", line)) {
      for (auto word = takeWord(*options); !word.empty(); word = takeWord(*options)) addOption(conf.options, word);
    }
  }
  if (conf.servers.empty()) conf.servers = {"127.0.0.1"};
  const std::size_t dot = nodeName.find('.');
  if (!hasSearch && dot != std::string_view::npos && dot + 1 < nodeName.size()) {
    conf.search = {std::string(nodeName.substr(dot + 1))};
  }
  return conf;
}

std::string replaceInResolvConf(std::string_view text, const std::optional<StringList>& servers,
                                const std::optional<StringList>& search) {
  std::string serverLines;
  for (const std::string& server : servers.value_or(StringList())) serverLines += "nameserver " + server + '\n';
  std::string searchLine = search.has_value() ? "search" : "";
  for (const std::string& name : search.value_or(StringList())) searchLine += ' ' + name;
  if (search.has_value()) searchLine += search->empty() ? " .\n" : "\n";

  std::string result;
  while (!text.empty()) {
    const std::string_view whole = text.substr(0, std::min(text.find('\n'), text.size() - 1) + 1);
    const std::string_view line = takeLineOfResolver(text);
    if (servers.has_value() && valueOf("nameserver", line)) {
      result += std::exchange(serverLines, {});
    } else if (search.has_value() && (valueOf("search", line) || valueOf("domain", line))) {
      result += std::exchange(searchLine, {});
    } else {
      result += whole;
    }
  }
  if (!result.empty() && !result.ends_with('\n') && !(searchLine + serverLines).empty()) result += '\n';
  return result + searchLine + serverLines;
}

bool namesOnlyLocalStub(const ResolvConf& conf) {
  const auto isStub = [](const std::string& server) { return server == "127.0.0.53" || server == "127.0.0.54"; };
  return !conf.servers.empty() && std::all_of(conf.servers.begin(), conf.servers.end(), isStub);
}

}  // namespace zorva::agent
