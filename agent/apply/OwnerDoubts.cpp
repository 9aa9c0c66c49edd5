#include "agent/apply/OwnerDoubts.h"

#include <unistd.h>

#include "agent/apply/BusObject.h"
#include "agent/apply/NetworkManagerDevice.h"
#include "agent/apply/NetworkManagerProfile.h"
#include "agent/sources/BusNames.h"
#include "util/ReadFile.h"

namespace zorva::agent {
namespace {

/// A service of the service manager.
struct Unit {
  bool isStill = false;    ///< it does not run, and is not about to start
  bool isEnabled = false;  ///< it starts with the host
};

// Nothing where no service manager answers.
std::optional<Unit> readUnit(BusCalls& bus, const std::string& name) {
  std::string path;
  const auto loaded = BusObject(bus, kSystemdService, kSystemdPath)
                          .call(
                              kSystemdManager, "LoadUnit", [&](BusWriter& arguments) { arguments.text(name); },
                              [&](BusReader& answer) { path = answer.text(); });
  if (!loaded) return std::nullopt;
  std::string state;
  std::string file;
  std::uint32_t job = 0;
  const auto read = BusObject(bus, kSystemdService, path)
                        .readProperties(kSystemdUnit, [&](BusReader& reader, const std::string& property) {
                          if (property == "ActiveState") reader.ifText(state);
                          if (property == "UnitFileState") reader.ifText(file);
                          if (property != "Job") return;
                          reader.ifVariant("(uo)", [&] {
                            reader.structure("uo", [&] {
                              job = reader.number();
                              reader.skip();
                            });
                          });
                        });
  if (!read) return std::nullopt;
  return Unit{(state == "inactive" || state == "failed") && job == 0, file.starts_with("enabled")};
}

}  // namespace

std::optional<OwnerDoubt> OwnerDoubts::about(const std::string& owner, const Link& link, bool runs) {
  if (!runs) return aboutAbsent(owner, link);
  std::optional<Kind> kind;
  if (owner == "NetworkManager") kind = aboutNetworkManager(link);
  if (owner == "systemd-networkd") kind = aboutNetworkd(link);
  if (!kind) return std::nullopt;
  return OwnerDoubt{*kind, owner + " has not finished with " + link.name +
                               ", so who owns its DNS settings is not known; try again when it has"};
}

std::optional<OwnerDoubt> OwnerDoubts::aboutAbsent(const std::string& owner, const Link& link) {
  const auto unit = readUnit(bus_, owner + ".service");
  if (unit && !unit->isStill) {
    return OwnerDoubt{Kind::Starting, owner + " is starting or stopping, so who owns the DNS settings of " + link.name +
                                          " is not known; try again when it runs"};
  }
  if ((unit && !unit->isEnabled) || !hasRun(owner, link)) return std::nullopt;
  return OwnerDoubt{unit ? Kind::Stopped : Kind::Unclear, owner + " may own the DNS settings of " + link.name +
                                                              " and does not run; 'systemctl start " + owner +
                                                              "' starts it, or 'systemctl disable --now " + owner +
                                                              "' leaves " + link.name + " to others"};
}

// As its files in /run say, which stay when it ends.
bool OwnerDoubts::hasRun(const std::string& owner, const Link& link) const {
  const auto isThere = [&](const char* path) { return ::access((root_ + path).c_str(), F_OK) == 0; };
  if (owner == "systemd-networkd") return isThere("/run/systemd/netif/state");
  if (owner == "systemd-resolved") return isThere("/run/systemd/resolve/resolv.conf");
  constexpr std::size_t kLongest = 4096;
  const util::FileText file =
      util::readFile(root_ + "/run/NetworkManager/devices/" + std::to_string(link.index), kLongest);
  return file.text.find("\nmanaged=true\n") != std::string::npos;
}

// While it starts it has not looked at all of its profiles. While it stops it lets go of its devices, and its file says
// that they are its own all the same. It is asked for itself last: who answers then has not ended before.
std::optional<OwnerDoubt::Kind> OwnerDoubts::aboutNetworkManager(const Link& link) {
  const auto device = readDevice(bus_, link.name);
  bool starts = false;
  const auto asked = networkManagerObject(bus_, kNetworkManagerPath)
                         .readProperties(kNetworkManagerService, [&](BusReader& reader, const std::string& name) {
                           if (name == "Startup") reader.ifVariant("b", [&] { starts = reader.flag(); });
                         });
  if (!asked || (starts && (!device || device->isManaged))) return Kind::Starting;
  if (!device) return std::nullopt;
  const bool isInUse = device->isManaged && isBusPath(device->active) && !device->isExternal;
  const bool isLeft = !device->isManaged && hasRun("NetworkManager", link);
  return isInUse || isLeft ? std::optional(Kind::Unclear) : std::nullopt;
}

// A link that it does not manage is "unmanaged" once it has looked at it.
std::optional<OwnerDoubt::Kind> OwnerDoubts::aboutNetworkd(const Link& link) {
  const BusObject manager(bus_, kNetworkdService, kNetworkdPath);
  std::string path;
  const auto found = manager.call(
      kNetworkdManager, "GetLinkByIndex", [&](BusWriter& arguments) { arguments.signedNumber(link.index); },
      [&](BusReader& answer) {
        answer.skip();
        path = answer.text();
      });
  if (!found) {
    const bool hasEnded = !manager.readProperties(kNetworkdManager, [](BusReader&, const std::string&) {});
    return hasEnded ? std::optional(Kind::Starting) : std::nullopt;  // else it does not know the link
  }
  std::string state;
  const auto read = BusObject(bus_, kNetworkdService, path)
                        .readProperties(kNetworkdLink, [&](BusReader& reader, const std::string& name) {
                          if (name == "AdministrativeState") reader.ifText(state);
                        });
  if (!read || state == "pending" || state == "initialized") return Kind::Starting;
  return state == "unmanaged" ? std::nullopt : std::optional(Kind::Unclear);
}

}  // namespace zorva::agent
