// The cost of checking and of reading the live host, compared with the system calls that are needed for it.

#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <libmnl/libmnl.h>
#include <linux/rtnetlink.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <memory>
#include <stdexcept>

#include "agent/Seams.h"
#include "agent/interface/Instrumentation.h"
#include "agent/sources/HostSource.h"
#include "bench/agent/PlaceCursor.h"

namespace {

using Socket = std::unique_ptr<mnl_socket, int (*)(mnl_socket*)>;

Socket openSocket(unsigned int groups) {
  Socket socket(::mnl_socket_open2(NETLINK_ROUTE, SOCK_CLOEXEC), &::mnl_socket_close);
  if (socket == nullptr || ::mnl_socket_bind(socket.get(), groups, MNL_SOCKET_AUTOPID) != 0) {
    throw std::runtime_error("no netlink socket");
  }
  return socket;
}

void PlaceCursor(benchmark::State& state) { placeCursors(state); }
BENCHMARK(PlaceCursor);

// One socket for the kernel's messages, and one inotify descriptor each for the host's files and for the overlay.
void BareReads(benchmark::State& state) {
  const Socket socket = openSocket(RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR);
  const std::array<int, 2> watches{::inotify_init1(IN_NONBLOCK | IN_CLOEXEC),
                                   ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)};
  std::array<char, 8192> buffer;
  for (auto _ : state) {
    benchmark::DoNotOptimize(
        ::recv(::mnl_socket_get_fd(socket.get()), buffer.data(), buffer.size(), MSG_DONTWAIT | MSG_TRUNC));
    for (const int watch : watches) benchmark::DoNotOptimize(::read(watch, buffer.data(), buffer.size()));
  }
  for (const int watch : watches) ::close(watch);
}
BENCHMARK(BareReads);

void ReadHost(benchmark::State& state) {
  zorva::agent::HostSource source;
  source.read();  // opens what stays open
  for (auto _ : state) benchmark::DoNotOptimize(source.read());
}
BENCHMARK(ReadHost);

// Requests one table and reads the response to its end.
void dump(const Socket& socket, unsigned short type, unsigned int sequence, std::array<char, 32768>& buffer) {
  std::array<char, 64> room{};
  nlmsghdr* message = ::mnl_nlmsg_put_header(room.data());
  message->nlmsg_type = type;
  message->nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
  message->nlmsg_seq = sequence;
  if (type == RTM_GETLINK) {
    ::mnl_nlmsg_put_extra_header(message, sizeof(ifinfomsg));
    ::mnl_attr_put_u32(message, IFLA_EXT_MASK, RTEXT_FILTER_SKIP_STATS);
  } else {
    ::mnl_nlmsg_put_extra_header(message, sizeof(ifaddrmsg));
  }
  if (::mnl_socket_sendto(socket.get(), message, message->nlmsg_len) < 0) throw std::runtime_error("no answer");
  for (;;) {
    const ssize_t got = ::mnl_socket_recvfrom(socket.get(), buffer.data(), buffer.size());
    int left = static_cast<int>(got);
    const auto* answer = reinterpret_cast<const nlmsghdr*>(buffer.data());
    for (; ::mnl_nlmsg_ok(answer, left); answer = ::mnl_nlmsg_next(answer, &left)) {
      if (answer->nlmsg_type == NLMSG_DONE) return;
    }
  }
}

void readWhole(const char* path, std::array<char, 32768>& buffer) {
  const int file = ::open(path, O_RDONLY | O_CLOEXEC);
  if (file < 0) return;
  struct stat status {};
  benchmark::DoNotOptimize(::fstat(file, &status));
  while (::read(file, buffer.data(), buffer.size()) > 0) {
  }
  ::close(file);
}

void RawDumpsAndReads(benchmark::State& state) {
  const Socket socket = openSocket(0);
  std::array<char, 32768> buffer;
  unsigned int sequence = 0;
  for (auto _ : state) {
    readWhole("/etc/resolv.conf", buffer);
    readWhole("/etc/hosts", buffer);
    dump(socket, RTM_GETLINK, ++sequence, buffer);
    dump(socket, RTM_GETADDR, ++sequence, buffer);
  }
}
BENCHMARK(RawDumpsAndReads);

}  // namespace
