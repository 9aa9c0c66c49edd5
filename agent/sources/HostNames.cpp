#include "agent/sources/HostNames.h"

#include <strings.h>

#include <algorithm>

#include "agent/files/Lines.h"

namespace zorva::agent {
namespace {

bool equalNames(const std::string& left, const std::string& right) {
  return ::strcasecmp(left.c_str(), right.c_str()) == 0;
}

std::string beforeDot(const std::string& name) { return name.substr(0, name.find('.')); }

std::string afterDot(const std::string& name) {
  const std::size_t dot = name.find('.');
  return dot == std::string::npos ? std::string() : name.substr(dot + 1);
}

// The host's domain according to one line of a hosts file, or empty text. The words are an address, the canonical name,
// and aliases.
std::string domainInLine(const std::string& host, const StringList& words) {
  if (words.size() < 2) return {};
  const std::string& canonical = words[1];
  if (equalNames(beforeDot(canonical), "localhost")) return {};
  const bool namesHost =
      equalNames(beforeDot(canonical), host) ||
      std::any_of(words.begin() + 2, words.end(), [&](const std::string& alias) { return equalNames(alias, host); });
  return namesHost ? afterDot(canonical) : std::string();
}

std::string domainInHosts(const std::string& host, std::string_view hosts) {
  while (!hosts.empty()) {
    std::string domain = domainInLine(host, wordsOf(takeLine(hosts)));
    if (!domain.empty()) return domain;
  }
  return {};
}

}  // namespace

HostNames findHostNames(const std::string& nodeName, std::string_view hosts, const ResolvConf& conf) {
  HostNames names{beforeDot(nodeName), afterDot(nodeName)};
  if (names.domain.empty()) names.domain = domainInHosts(names.host, hosts);
  if (names.domain.empty()) names.domain = conf.domain;
  if (names.domain.empty() && !conf.search.empty()) names.domain = conf.search.front();
  return names;
}

}  // namespace zorva::agent
