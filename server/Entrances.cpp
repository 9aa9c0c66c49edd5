#include "server/Entrances.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <utility>

#include "http/Log.h"
#include "server/Systemd.h"
#include "util/HostName.h"
#include "util/ServiceHost.h"

namespace zorva::server {

namespace {

void requireLogins(const Config& config, bool hasUsers, const std::string& where) {
  if (hasUsers || !config.tls.clientCa.empty()) return;
  throw std::invalid_argument(where + " can be reached from other hosts, and nobody can log in: there is no user in " +
                              config.access.usersFile + " (zorvactl user add), and tls.client_ca is not set");
}

bool isLoopback(const std::string& address) { return address == "::1" || address.starts_with("127."); }

/// The socket of the configuration. The usual one is made where that is possible.
void addUnixListener(const Config& config, std::vector<http::Listener>& listeners) {
  if (config.socket.has_value()) {
    if (!config.socket->empty()) listeners.push_back(http::listenOnUnix(*config.socket));
    return;
  }
  const std::string directory = std::filesystem::path(kDefaultSocket).parent_path().string();
  if (::access(directory.c_str(), W_OK) != 0) return;
  try {
    listeners.push_back(http::listenOnUnix(kDefaultSocket));
  } catch (const std::runtime_error& error) {
    ZORVA_LOG(Warning, error.what());
  }
}

void addAll(std::vector<http::Listener>& listeners, std::vector<http::Listener> more) {
  std::move(more.begin(), more.end(), std::back_inserter(listeners));
}

/// A name instead of an address that clients do not use: loopback, or all addresses.
std::string urlForPeople(const http::Listener& listener) {
  const std::string& url = listener.url;
  const std::size_t host = url.find("://") + 3;
  const std::size_t port = url.rfind(':');
  if (url.starts_with("unix:")) return url;
  const std::string address = url.substr(host, port - host);
  if (address == "127.0.0.1") return url.substr(0, host) + "localhost" + url.substr(port);
  if (address == "0.0.0.0" || address == "[::]") return url.substr(0, host) + util::kernelHostName() + url.substr(port);
  return url;
}

std::string withLogin(const std::string& url, const std::string& login) {
  return "https://" + login + "@" + url.substr(std::string("https://").size());
}

/// Commands that send a request through a listener.
std::vector<std::string> commandsFor(const http::Listener& listener) {
  constexpr const char* kClass = "/root/cimv2:ZORVA_DNSProtocolEndPoint";
  const std::string url = urlForPeople(listener);
  if (url.starts_with("unix:")) return {"zorvactl --url " + url + " show"};
  if (listener.door == http::Door::Http) {
    return {"wbemcli ein " + url + kClass, "zorvactl --url " + url + "/root/cimv2 show"};
  }
  return {"wbemcli ein -cacert server.crt " + withLogin(url, "USER:PASSWORD") + kClass,
          "zorvactl --url " + withLogin(url, "USER") + "/root/cimv2 show"};
}

/// The commands for one listener of each kind: a second address needs no second example.
std::vector<std::string> commandsFor(const std::vector<http::Listener>& listeners) {
  std::vector<std::string> commands;
  std::vector<std::string> schemes;
  for (const http::Listener& each : listeners) {
    const std::string scheme = each.url.substr(0, each.url.find(':'));
    if (std::find(schemes.begin(), schemes.end(), scheme) != schemes.end()) continue;
    schemes.push_back(scheme);
    const std::vector<std::string> more = commandsFor(each);
    commands.insert(commands.end(), more.begin(), more.end());
  }
  return commands;
}

}  // namespace

void checkLogins(const Config& config, bool hasUsers) {
  if (config.tls.certificate.empty() || !config.tlsAddresses.has_value()) return;
  for (const std::string& each : *config.tlsAddresses) {
    if (!isLoopback(each)) requireLogins(config, hasUsers, "tls.addresses: '" + each + "'");
  }
}

std::vector<http::Listener> openListeners(const Config& config, bool hasUsers) {
  const bool hasTls = !config.tls.certificate.empty();
  const http::Inherited inherited = inheritedSockets();
  std::vector<http::Listener> listeners =
      http::adoptListeners(inherited, hasTls ? std::optional<int>(config.tlsPort) : std::nullopt);
  for (const http::Listener& each : listeners) {
    if (!each.isLocal) requireLogins(config, hasUsers, each.url);
  }
  checkLogins(config, hasUsers);
  if (inherited.count == 0) addAll(listeners, http::listenOn(config.addresses, config.port));
  const bool isHttpsThere =
      std::any_of(listeners.begin(), listeners.end(), [](const auto& each) { return each.door == http::Door::Https; });
  if (hasTls && !isHttpsThere) {
    addAll(listeners, http::listenOn(config.tlsAddresses, config.tlsPort, http::Door::Https));
  }
  if (inherited.count == 0) addUnixListener(config, listeners);
  return listeners;
}

std::string greetingOf(const std::vector<http::Listener>& listeners, bool withHints) {
  std::string text = "zorvacimd listens on ";
  for (const http::Listener& each : listeners) text += (&each == listeners.data() ? "" : " and ") + each.url;
  text += '\n';
  if (!withHints) return text;
  const char* begin = "ask it:  ";
  for (const std::string& each : commandsFor(listeners)) {
    text += begin + each + "\n";
    begin = "    or:  ";
  }
  return text;
}

std::string pageOf(const std::vector<http::Listener>& listeners) {
  std::string text = "This is zorvacimd " ZORVA_VERSION
                     ", a CIM server: it publishes the DNS client configuration of this host.\n"
                     "Programs ask it by CIM-XML over HTTP POST (DSP0200). These do:\n\n";
  for (const std::string& each : commandsFor(listeners)) text += "  " + each + "\n";
  return text;
}

}  // namespace zorva::server
