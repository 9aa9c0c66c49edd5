#pragma once

// The names on the bus that both those who read an owner's DNS settings and those who change them use.

namespace zorva::agent {

inline constexpr const char* kBusProperties = "org.freedesktop.DBus.Properties";

// systemd-resolved
inline constexpr const char* kResolvedService = "org.freedesktop.resolve1";
inline constexpr const char* kResolvedPath = "/org/freedesktop/resolve1";
inline constexpr const char* kResolvedManager = "org.freedesktop.resolve1.Manager";
inline constexpr const char* kResolvedLink = "org.freedesktop.resolve1.Link";

// systemd-networkd
inline constexpr const char* kNetworkdService = "org.freedesktop.network1";
inline constexpr const char* kNetworkdPath = "/org/freedesktop/network1";
inline constexpr const char* kNetworkdManager = "org.freedesktop.network1.Manager";
inline constexpr const char* kNetworkdLink = "org.freedesktop.network1.Link";

// NetworkManager. Its service is also the interface of its manager.
inline constexpr const char* kNetworkManagerService = "org.freedesktop.NetworkManager";
inline constexpr const char* kNetworkManagerPath = "/org/freedesktop/NetworkManager";
inline constexpr const char* kNetworkManagerDevice = "org.freedesktop.NetworkManager.Device";

// The service manager
inline constexpr const char* kSystemdService = "org.freedesktop.systemd1";
inline constexpr const char* kSystemdPath = "/org/freedesktop/systemd1";
inline constexpr const char* kSystemdManager = "org.freedesktop.systemd1.Manager";
inline constexpr const char* kSystemdUnit = "org.freedesktop.systemd1.Unit";

}  // namespace zorva::agent
