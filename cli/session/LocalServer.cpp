#include "cli/session/LocalServer.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

#include "agent/Agent.h"
#include "agent/config/Config.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"
#include "util/FileDescriptor.h"

namespace zorva::cli {

namespace {

bool isSet(const char* variable) {
  const char* value = std::getenv(variable);
  return value != nullptr && *value != '\0';
}

bool answers(const std::string& socket) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (socket.size() >= sizeof address.sun_path) return false;
  std::memcpy(address.sun_path, socket.data(), socket.size());
  const util::FileDescriptor connection(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  return connection && ::connect(connection.get(), reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
}

bool mayWriteSettings() {
  return ::geteuid() == 0 || ::access(zorva::agent::dataDirectory().c_str(), W_OK | X_OK) == 0;
}

}  // namespace

std::optional<Server> serverInstead(const Globals& globals) {
  const bool isUsualHost = globals.config.empty() && globals.providerDirectory.empty() && !isSet("ZORVAGENT_CONFIG");
  if (!isUsualHost && !isSet("ZORVACTL_SOCKET")) return std::nullopt;
  asFailure([&] { zorva::agent::loadConfig(globals.config); });
  if (mayWriteSettings() || !answers(usualSocket())) return std::nullopt;
  Server server{readServerUrl("unix:")};
  server.patience = globals.servers.timeout;
  tellNote("this user may not write to " + printable(zorva::agent::dataDirectory()) + "; the server at " +
           printable(server.url.shown()) + " is asked to do it");
  return server;
}

std::string hintForUnprivileged() {
  if (mayWriteSettings()) return {};
  return "run it as root, or as a member of the group zorva where zorvacimd runs; no server answers at " +
         printable(usualSocket());
}

}  // namespace zorva::cli
