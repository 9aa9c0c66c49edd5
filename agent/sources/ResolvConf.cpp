#include "agent/sources/ResolvConf.h"

#include <algorithm>

#include "agent/files/Lines.h"
#include "agent/tree/IpAddress.h"

namespace zorva::agent {
namespace {

bool isServer(const std::string& text) {
  const std::size_t zone = text.find('%');
  if (zone == std::string::npos) return isIPv4Address(text) || isIPv6Address(text);
  return zone + 1 < text.size() && isIPv6Address(text.substr(0, zone));
}

// The words after the keyword, or none if the line has another one.
StringList wordsAfter(std::string_view keyword, std::string_view line) {
  if (!line.starts_with(keyword)) return {};
  line.remove_prefix(keyword.size());
  if (!line.starts_with(' ') && !line.starts_with('\t')) return {};
  return wordsOf(line);
}

}  // namespace

ResolvConf parseResolvConf(std::string_view text) {
  ResolvConf conf;
  while (!text.empty()) {
    const std::string_view line = takeLine(text);
    if (const StringList server = wordsAfter("nameserver", line); !server.empty()) {
      if (isServer(server.front())) conf.servers.push_back(server.front());
    } else if (const StringList domain = wordsAfter("domain", line); !domain.empty()) {
      conf.domain = domain.front();
      conf.search = {domain.front()};
    } else if (StringList search = wordsAfter("search", line); !search.empty()) {
      conf.domain.clear();
      conf.search = std::move(search);
    }
  }
  std::erase(conf.search, ".");
  if (conf.domain == ".") conf.domain.clear();
  return conf;
}

bool namesOnlyLocalStub(const ResolvConf& conf) {
  const auto isStub = [](const std::string& server) { return server == "127.0.0.53" || server == "127.0.0.54"; };
  return !conf.servers.empty() && std::all_of(conf.servers.begin(), conf.servers.end(), isStub);
}

}  // namespace zorva::agent
