#include "http/ClientIdentity.h"

#include <linux/inet_diag.h>
#include <linux/netlink.h>
#include <linux/sock_diag.h>
#include <netinet/in.h>

#include <cstring>
#include <optional>

#include "http/AddressText.h"
#include "util/FileDescriptor.h"

namespace zorva::http {

namespace {

/// An end of a connection in the form of sock_diag(7).
struct End {
  std::uint8_t family = 0;
  std::uint16_t port = 0;      ///< in network order
  std::uint32_t address[4]{};  ///< an IPv4 address is in the first
};

End endOf(const sockaddr_storage& address) {
  End end;
  end.family = static_cast<std::uint8_t>(address.ss_family);
  if (address.ss_family == AF_INET6) {
    sockaddr_in6 v6{};
    std::memcpy(&v6, &address, sizeof v6);
    end.port = v6.sin6_port;
    std::memcpy(end.address, &v6.sin6_addr, sizeof v6.sin6_addr);
  } else if (address.ss_family == AF_INET) {
    sockaddr_in v4{};
    std::memcpy(&v4, &address, sizeof v4);
    end.port = v4.sin_port;
    end.address[0] = v4.sin_addr.s_addr;
  }
  return end;
}

/// The owner of the socket of this host that is bound to `own` and connected to `other`.
std::optional<std::uint32_t> ownerOf(const End& own, const End& other) {
  struct {
    nlmsghdr header;
    inet_diag_req_v2 body;
  } request{};
  request.header.nlmsg_len = sizeof request;
  request.header.nlmsg_type = SOCK_DIAG_BY_FAMILY;
  request.header.nlmsg_flags = NLM_F_REQUEST;
  request.body.sdiag_family = own.family;
  request.body.sdiag_protocol = IPPROTO_TCP;
  request.body.idiag_states = ~0U;
  request.body.id.idiag_sport = own.port;
  request.body.id.idiag_dport = other.port;
  std::memcpy(request.body.id.idiag_src, own.address, sizeof own.address);
  std::memcpy(request.body.id.idiag_dst, other.address, sizeof other.address);
  request.body.id.idiag_cookie[0] = request.body.id.idiag_cookie[1] = INET_DIAG_NOCOOKIE;

  const util::FileDescriptor kernel(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_SOCK_DIAG));
  if (!kernel || ::send(kernel.get(), &request, sizeof request, 0) < 0) return std::nullopt;
  alignas(nlmsghdr) char answer[1024];
  // The kernel has answered when send() returns.
  const ssize_t size = ::recv(kernel.get(), answer, sizeof answer, MSG_DONTWAIT);
  nlmsghdr header{};
  inet_diag_msg message{};
  if (size < static_cast<ssize_t>(NLMSG_LENGTH(sizeof message))) return std::nullopt;
  std::memcpy(&header, answer, sizeof header);
  if (header.nlmsg_type != SOCK_DIAG_BY_FAMILY) return std::nullopt;
  std::memcpy(&message, answer + NLMSG_HDRLEN, sizeof message);
  return message.idiag_uid;
}

/// The process at the other end of a Unix socket, as it was when it connected.
std::optional<ucred> processAt(int socket) {
  ucred process{};
  socklen_t size = sizeof process;
  if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &process, &size) != 0) return std::nullopt;
  return process;
}

}  // namespace

std::string clientOf(int socket, const sockaddr_storage& peer) {
  if (peer.ss_family == AF_UNIX) {
    const auto process = processAt(socket);
    return process ? "user " + std::to_string(process->uid) : "this host";
  }
  if (!isLoopback(peer)) return hostText(peer);
  sockaddr_storage local{};
  socklen_t size = sizeof local;
  if (::getsockname(socket, reinterpret_cast<sockaddr*>(&local), &size) != 0) return "this host";
  const auto owner = ownerOf(endOf(peer), endOf(unmapped(local)));
  return owner ? "user " + std::to_string(*owner) : "this host";
}

access::Origin originOf(int socket, const sockaddr_storage& peer, bool isEncrypted) {
  access::Origin origin;
  origin.isEncrypted = isEncrypted;
  origin.address = hostText(peer);
  if (peer.ss_family == AF_UNIX) {
    origin.way = access::Origin::Way::UnixSocket;
    if (const auto process = processAt(socket)) origin.localUser = process->uid;
  } else {
    origin.way = isLoopback(peer) ? access::Origin::Way::Loopback : access::Origin::Way::Network;
  }
  return origin;
}

std::string peerText(int socket, const sockaddr_storage& peer) {
  if (peer.ss_family != AF_UNIX) return addressText(peer);
  const auto process = processAt(socket);
  // A process of another process namespace has the number 0.
  return process && process->pid > 0 ? "process " + std::to_string(process->pid) : addressText(peer);
}

}  // namespace zorva::http
