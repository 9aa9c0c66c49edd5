#include "agent/apply/NetworkManagerDevice.h"

#include <cstdint>

#include "agent/apply/NetworkManagerProfile.h"  // networkManagerObject
#include "agent/sources/BusNames.h"

namespace zorva::agent {
namespace {

constexpr const char* kActive = "org.freedesktop.NetworkManager.Connection.Active";
constexpr std::uint32_t kExternal = 0x80;  // NM_ACTIVATION_STATE_FLAG_EXTERNAL

}  // namespace

Expected<NetworkManagerDevice, std::string> readDevice(BusCalls& bus, const std::string& interface) {
  NetworkManagerDevice device;
  Expected<void, std::string> done =
      networkManagerObject(bus, kNetworkManagerPath)
          .call(
              kNetworkManagerService, "GetDeviceByIpIface", [&](BusWriter& arguments) { arguments.text(interface); },
              [&](BusReader& answer) { device.path = answer.text(); });
  if (done) {
    done = networkManagerObject(bus, device.path)
               .readProperties(kNetworkManagerDevice, [&](BusReader& reader, const std::string& name) {
                 if (name == "Managed") reader.ifVariant("b", [&] { device.isManaged = reader.flag(); });
                 if (name == "ActiveConnection") reader.ifPath(device.active);
                 if (name == "Dhcp4Config") reader.ifPath(device.lease);
               });
  }
  if (done && isBusPath(device.active)) {
    done = networkManagerObject(bus, device.active)
               .readProperties(kActive, [&](BusReader& reader, const std::string& name) {
                 if (name == "Connection") reader.ifPath(device.profile);
                 if (name == "StateFlags") {
                   reader.ifVariant("u", [&] { device.isExternal = (reader.number() & kExternal) != 0; });
                 }
               });
  }
  if (!done) return unexpected(done.error());
  return device;
}

}  // namespace zorva::agent
