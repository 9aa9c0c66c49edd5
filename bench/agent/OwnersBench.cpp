// What it costs to look at a host whose DNS settings have owners, while nothing changes, beside the system calls that
// this cannot do without. Runs on a private host with the real daemons; ends with 77 where there can be none.
#include <benchmark/benchmark.h>
#include <linux/rtnetlink.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <exception>
#include <stdexcept>
#include <string>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/interface/Instrumentation.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHost.h"
#include "bench/agent/PlaceCursor.h"

namespace {

constexpr int kNoPrivateHost = 77;

void PlaceCursorWithOwners(benchmark::State& state) { placeCursors(state); }
BENCHMARK(PlaceCursorWithOwners);

int openNetlink() {
  const int socket = ::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE);
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR;
  if (::bind(socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0)
    throw std::runtime_error("no netlink");
  return socket;
}

int connectToBus() {
  const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "/run/dbus/system_bus_socket");
  if (::connect(socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) throw std::runtime_error("no bus");
  return socket;
}

// One socket each for the kernel's reports and the bus, one inotify each for the host's files and for the values that
// were set, and a look at each of the directories by which two of the owners report what they do not signal.
void BareReadsWithOwners(benchmark::State& state) {
  const std::array<int, 2> sockets{openNetlink(), connectToBus()};
  const std::array<int, 2> watches{::inotify_init1(IN_NONBLOCK | IN_CLOEXEC),
                                   ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)};
  std::array<char, 8192> buffer;
  struct stat status {};
  for (auto _ : state) {
    for (const int socket : sockets) {
      benchmark::DoNotOptimize(::recv(socket, buffer.data(), buffer.size(), MSG_DONTWAIT | MSG_TRUNC));
    }
    for (const int watch : watches) benchmark::DoNotOptimize(::read(watch, buffer.data(), buffer.size()));
    benchmark::DoNotOptimize(::stat("/run/systemd/resolve/netif", &status));
    benchmark::DoNotOptimize(::stat("/run/systemd/netif/links", &status));
  }
  for (const int descriptor : sockets) ::close(descriptor);
  for (const int descriptor : watches) ::close(descriptor);
}
BENCHMARK(BareReadsWithOwners);

bool measure() {
  using zorva::agent::testing::outputOf;
  zorva::agent::testing::Interfaces interfaces;
  interfaces.addPair("eth0", "far0");
  for (const char* name : {"eth0", "far0"}) interfaces.setUp(name, true);
  zorva::agent::testing::Daemons daemons;
  for (const char* name : {"systemd-resolved", "systemd-networkd", "NetworkManager"}) daemons.start(name);
  outputOf("resolvectl dns far0 198.51.100.53");
  outputOf(
      "nmcli connection add type ethernet ifname eth0 con-name lan ipv4.method manual ipv4.addresses 192.0.2.10/24 "
      "ipv4.dns 192.0.2.53 ipv6.method disabled; nmcli connection up lan");
  ::sleep(2);  // until the daemons are still
  return benchmark::RunSpecifiedBenchmarks() > 0;
}

}  // namespace

int main(int argc, char** argv) try {
  benchmark::Initialize(&argc, argv);
  if (!zorva::agent::testing::canMakePrivateHosts()) {
    std::fprintf(stderr, "this needs root, and a kernel or container that permits new namespaces with an overlayfs\n");
    return kNoPrivateHost;
  }
  return zorva::agent::testing::runOnHostWithDaemons(measure) ? 0 : 1;
} catch (const std::exception& error) {
  std::fprintf(stderr, "%s\n", error.what());
  return 1;
}
