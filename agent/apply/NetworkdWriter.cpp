#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <filesystem>
#include <optional>
#include <system_error>
#include <utility>

#include "agent/apply/Writers.h"
#include "agent/config/Config.h"
#include "agent/log/LogOutput.h"
#include "agent/sources/BusNames.h"
#include "agent/tree/Json.h"
#include "util/Escape.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::agent {
namespace {

constexpr const char* kOwner = "systemd-networkd";
constexpr const char* kFileName = "50-zorva.conf";
constexpr std::size_t kLargestFile = std::size_t{64} << 10;

SystemBus::Method managerMethod(const char* member) {
  return {kNetworkdService, kNetworkdPath, kNetworkdManager, member};
}

// The address in a server with port and name: "192.0.2.1:853#name", "[2001:db8::1]:853#name", "2001:db8::1#name".
std::string addressIn(const std::string& inFull) {
  if (inFull.starts_with('[')) return inFull.substr(1, inFull.find(']') - 1);
  const std::string server = inFull.substr(0, inFull.find('#'));
  const bool hasPort = std::count(server.begin(), server.end(), ':') == 1;
  return hasPort ? server.substr(0, server.find(':')) : server;
}

// As systemd.network(5) takes it: the link itself is the zone.
std::string withoutZone(std::string server) {
  const std::size_t zone = server.find('%');
  if (zone != std::string::npos) server.erase(zone, std::min(server.find_first_of("]#", zone), server.size()) - zone);
  return server;
}

std::string inFull(const std::string& server, const DnsTarget& target) {
  for (const std::string& known : target.serversInFull) {
    if (addressIn(known) == server) return withoutZone(known);
  }
  return withoutZone(server);
}

std::string textOf(const DnsTarget& target, const DnsSettings& settings) {
  std::string text = "# The DNS settings of " + target.interface +
                     ", set by 'zorvactl apply'. 'zorvactl revert' removes this file.\n[Network]\nDNS=\n";
  for (const std::string& server : settings.servers) text += "DNS=" + inFull(server, target) + '\n';
  text += "Domains=\n";
  for (const std::string& suffix : settings.suffixes) text += "Domains=" + suffix + '\n';
  for (const std::string& domain : target.routingDomains) text += "Domains=~" + domain + '\n';
  for (const char* section : {"DHCPv4", "DHCPv6", "IPv6AcceptRA"}) {
    text += std::string("[") + section + "]\nUseDNS=no\nUseDomains=no\n";
  }
  return text;
}

class NetworkdWriter : public DnsWriter {
 public:
  NetworkdWriter(BusCalls& bus, std::string root) : bus_(bus), root_(std::move(root)) {}

  DnsSettings asHeld(const DnsSettings& settings) const override { return settings; }

  Expected<std::string, Refusal> save(const DnsTarget& target) override {
    const auto directory = directoryOf(target);
    if (!directory) return unexpected(directory.error());
    const util::FileText file = util::readFile(*directory + kFileName, kLargestFile);
    if (file.truncated || (file.error != 0 && file.error != ENOENT)) {
      return unexpected(*directory + kFileName +
                        ": cannot be read: " + util::fileErrorText(file.truncated ? EFBIG : file.error));
    }
    JsonValue saved = JsonValue::object();
    if (file.error == 0) saved.add("text", JsonValue::ofText(file.text));
    return formatJson(saved);
  }

  Expected<void, Refusal> write(const DnsTarget& target, const DnsSettings& settings) override {
    const auto before = save(target);
    if (!before) return unexpected(before.error());
    auto done = put(target, textOf(target, settings));
    if (done) done = reload();
    if (done) return {};
    const auto undone = restore(target, *before);
    (void)undone;  // the file is as before even where the daemon cannot be told
    return done;
  }

  Expected<void, Refusal> restore(const DnsTarget& target, const std::string& saved) override {
    std::optional<std::string> text;
    try {
      const JsonValue value = parseJson(saved, "the saved drop-in");
      const JsonValue* found = value.kind == JsonValue::Kind::Object ? value.find("text") : nullptr;
      if (found != nullptr && found->kind == JsonValue::Kind::Text) text = found->text;
    } catch (const ConfigError& error) {
      return unexpected(std::string(error.what()));
    }
    const auto done = text.has_value() ? put(target, *text) : remove(target);
    return done ? reload() : done;
  }

  // A runtime setting of resolvectl's counts more than the file, and old versions overlook a drop-in on a reload.
  Expected<void, Refusal> insist(const DnsTarget& target) override {
    const auto fill = [&target](sd_bus_message* message) {
      return ::sd_bus_message_append(message, "i", target.index);
    };
    const auto done = told(bus_.call(managerMethod("RevertLinkDNS"), fill));
    return done ? told(bus_.call(managerMethod("ReconfigureLink"), fill)) : done;
  }

 private:
  // The directory of the drop-in, with a slash at its end.
  Expected<std::string, Refusal> directoryOf(const DnsTarget& target) const {
    constexpr std::array kPlaces{"/etc/systemd/network/", "/run/systemd/network/", "/usr/lib/systemd/network/",
                                 "/usr/local/lib/systemd/network/", "/lib/systemd/network/"};
    for (const std::string place : kPlaces) {
      const std::string name = target.profile.starts_with(place) ? target.profile.substr(place.size()) : "";
      if (name.size() > kSuffix.size() && name.ends_with(kSuffix) && name.find('/') == std::string::npos) {
        return root_ + "/etc/systemd/network/" + name + ".d/";
      }
    }
    std::string problem = std::string(kOwner) + " has " + target.interface + " from '";
    util::appendEscaped(problem, target.profile);
    return unexpected(problem + "', which is no .network file that a drop-in can be put beside");
  }

  Expected<void, Refusal> put(const DnsTarget& target, const std::string& text) const {
    const auto directory = directoryOf(target);
    if (!directory) return unexpected(directory.error());
    std::error_code error;
    std::filesystem::create_directories(*directory, error);
    if (error) return unexpected(notWritten(*directory + ": cannot be made: " + error.message()));
    try {
      const std::string unsynced = util::replaceFile(*directory, kFileName, text);
      if (!unsynced.empty()) ZORVAGENT_LOG_ERROR(unsynced);
      return {};
    } catch (const std::exception& problem) {
      return unexpected(notWritten(problem.what()));
    }
  }

  static std::string notWritten(const std::string& problem) {
    return std::string(kOwner) + " needs a drop-in: " + problem + "; see to that, and apply again";
  }

  Expected<void, Refusal> remove(const DnsTarget& target) const {
    const auto directory = directoryOf(target);
    if (!directory) return unexpected(directory.error());
    const std::string path = *directory + kFileName;
    if (::unlink(path.c_str()) != 0 && errno != ENOENT) {
      return unexpected(notWritten(path + ": cannot be removed: " + std::generic_category().message(errno)));
    }
    ::rmdir(directory->c_str());  // stays where it has other files
    return {};
  }

  Expected<void, Refusal> reload() { return told(bus_.call(managerMethod("Reload"))); }

  static Expected<void, Refusal> told(const Expected<void, std::string>& answer) {
    if (answer) return {};
    return unexpected(std::string(kOwner) + ": " + answer.error() +
                      "; 'journalctl --unit systemd-networkd' may say more; see to that, and apply again");
  }

  static constexpr std::string_view kSuffix = ".network";

  BusCalls& bus_;
  std::string root_;
};

}  // namespace

std::unique_ptr<DnsWriter> makeNetworkdWriter(BusCalls& bus, const std::string& root) {
  return std::make_unique<NetworkdWriter>(bus, root);
}

}  // namespace zorva::agent
