#include "cli/session/LocalServer.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "agent/Agent.h"
#include "agent/config/Config.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/session/AsFailure.h"
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

/// A directory that does not exist holds nothing back from anybody.
bool mayReach(Need need) {
  if (::geteuid() == 0) return true;
  const int mode = need == Need::Read ? R_OK | X_OK : W_OK | X_OK;
  return ::access(zorva::agent::dataDirectory().c_str(), mode) == 0 || errno != EACCES;
}

}  // namespace

std::optional<Server> serverInstead(const Globals& globals, Need need) {
  if (::geteuid() == 0) return std::nullopt;
  asFailure([&] { zorva::agent::loadConfig(globals.config); });
  if (mayReach(need)) return std::nullopt;
  const bool isUsualHost = globals.config.empty() && globals.providerDirectory.empty() &&
                           globals.addedProviders.empty() && !isSet("ZORVAGENT_CONFIG");
  const std::string what = std::string("this user may not ") + (need == Need::Read ? "read " : "write to ") +
                           printable(zorva::agent::dataDirectory());
  if ((isUsualHost || isSet("ZORVACTL_SOCKET")) && answers(usualSocket())) {
    Server server{readServerUrl("unix:")};
    server.patience = globals.servers.timeout;
    tellNote(what + "; the server at " + printable(server.url.shown()) + " is asked");
    return server;
  }
  if (need == Need::Read) tellWarning(what + "; the settings that are stored there are not shown");
  return std::nullopt;
}

bool mayReadSettings() { return mayReach(Need::Read); }

std::string hintForUnprivileged() {
  if (mayReach(Need::Change)) return {};
  return "run it as root; or, where zorvacimd runs, as a member of the group zorva with --url unix:";
}

}  // namespace zorva::cli
