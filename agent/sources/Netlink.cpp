#include "agent/sources/Netlink.h"

#include <arpa/inet.h>
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/socket.h>
#include <sys/time.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <stdexcept>
#include <system_error>

namespace zorva::agent {
namespace {

// The most that the kernel sends at once.
constexpr std::size_t kBufferSize = 32768;
constexpr int kMostReports = 4096;  // read at one check; after that many the answer is known
constexpr int kMostDumps = 8;       // of one table, if each is interrupted by a change
// The kernel answers a dump at once; this only limits the damage of a broken kernel.
constexpr timeval kLongestAnswer{5, 0};

// Newer than the oldest kernel headers that this is built with.
constexpr int kAttributeOfProtocol = 11;  // IFA_PROTO
constexpr unsigned int kFromRouter = 2;   // IFAPROT_KERNEL_RA
constexpr unsigned int kLinkLocal = 3;    // IFAPROT_KERNEL_LL

[[noreturn]] void fail(const std::string& what) {
  throw std::runtime_error(what + ": " + std::generic_category().message(errno));
}

NetlinkSocket openSocket(unsigned int groups) {
  NetlinkSocket socket(::mnl_socket_open2(NETLINK_ROUTE, SOCK_CLOEXEC), &::mnl_socket_close);
  if (socket != nullptr && ::mnl_socket_bind(socket.get(), groups, MNL_SOCKET_AUTOPID) != 0) socket.reset();
  return socket;
}

// Calls handle with each attribute of a message that has a header of the given size before them.
template <typename Handler>
void forEachAttribute(const nlmsghdr* message, std::size_t headerSize, Handler handle) {
  const auto* attribute = static_cast<const nlattr*>(::mnl_nlmsg_get_payload_offset(message, headerSize));
  const auto* end = static_cast<const char*>(::mnl_nlmsg_get_payload_tail(message));
  const auto left = [&] { return static_cast<int>(end - reinterpret_cast<const char*>(attribute)); };
  for (; ::mnl_attr_ok(attribute, left()); attribute = ::mnl_attr_next(attribute)) handle(attribute);
}

// The text of an attribute, which may lack the NUL at its end.
std::string textOf(const nlattr* attribute) {
  const auto* text = static_cast<const char*>(::mnl_attr_get_payload(attribute));
  return {text, ::strnlen(text, ::mnl_attr_get_payload_len(attribute))};
}

template <typename Number>
Number numberOf(const nlattr* attribute) {
  Number number = 0;
  std::memcpy(&number, ::mnl_attr_get_payload(attribute),
              std::min<std::size_t>(sizeof number, ::mnl_attr_get_payload_len(attribute)));
  return number;
}

// False if the message is too short.
bool parseLink(const nlmsghdr* message, Link& link) {
  if (::mnl_nlmsg_get_payload_len(message) < sizeof(ifinfomsg)) return false;
  const auto* info = static_cast<const ifinfomsg*>(::mnl_nlmsg_get_payload(message));
  link.index = info->ifi_index;
  link.flags = info->ifi_flags;
  forEachAttribute(message, sizeof *info, [&link](const nlattr* attribute) {
    const int type = ::mnl_attr_get_type(attribute);
    if (type == IFLA_IFNAME) link.name = textOf(attribute);
    if (type == IFLA_OPERSTATE) link.operState = numberOf<std::uint8_t>(attribute);
  });
  return !link.name.empty();
}

// The four numbers of an IPv4 address. inet_ntop would also write them, but a host may have thousands of addresses, and
// it takes longer for one than the kernel.
std::string textOfIPv4(const std::array<unsigned char, sizeof(in_addr)>& address) {
  std::array<char, INET_ADDRSTRLEN> text;
  char* end = text.data();
  for (const unsigned char number : address) {
    if (end != text.data()) *end++ = '.';
    end = std::to_chars(end, text.data() + text.size(), number).ptr;
  }
  return {text.data(), end};
}

std::string addressText(int family, const nlattr* attribute) {
  const std::size_t size = family == AF_INET ? sizeof(in_addr) : sizeof(in6_addr);
  if (::mnl_attr_get_payload_len(attribute) < size) return {};
  if (family == AF_INET) {
    std::array<unsigned char, sizeof(in_addr)> address;
    std::memcpy(address.data(), ::mnl_attr_get_payload(attribute), size);
    return textOfIPv4(address);
  }
  std::array<char, INET6_ADDRSTRLEN> text{};
  ::inet_ntop(family, ::mnl_attr_get_payload(attribute), text.data(), text.size());
  return text.data();
}

// False if the message is too short, or about another family.
bool parseAddress(const nlmsghdr* message, LinkAddress& result) {
  if (::mnl_nlmsg_get_payload_len(message) < sizeof(ifaddrmsg)) return false;
  const auto* info = static_cast<const ifaddrmsg*>(::mnl_nlmsg_get_payload(message));
  if (info->ifa_family != AF_INET && info->ifa_family != AF_INET6) return false;
  result.index = static_cast<int>(info->ifa_index);
  result.address.prefixLength = info->ifa_prefixlen;
  unsigned int flags = info->ifa_flags;
  unsigned int protocol = 0;
  const nlattr* own = nullptr;
  forEachAttribute(message, sizeof *info, [&](const nlattr* attribute) {
    const int type = ::mnl_attr_get_type(attribute);
    if (type == IFA_FLAGS) flags = numberOf<std::uint32_t>(attribute);
    if (type == kAttributeOfProtocol) protocol = numberOf<std::uint8_t>(attribute);
    // On a link with a peer IFA_ADDRESS is the peer's, and IFA_LOCAL is ours.
    if (type == IFA_LOCAL || (type == IFA_ADDRESS && own == nullptr)) own = attribute;
  });
  if (own == nullptr) return false;
  result.address.address = addressText(info->ifa_family, own);
  result.address.origin = originOf(result.address, flags, protocol);
  return !result.address.address.empty();
}

// The error that ends a dump, as a positive number, or 0.
int errorOf(const nlmsghdr* message) {
  if (::mnl_nlmsg_get_payload_len(message) < sizeof(int)) return 0;
  int error = 0;
  std::memcpy(&error, ::mnl_nlmsg_get_payload(message), sizeof error);
  return -error;
}

}  // namespace

AddressOrigin originOf(const InterfaceAddress& address, unsigned int flags, unsigned int protocol) {
  const bool isIPv6 = address.family() == AddressFamily::IPv6;
  // fe80::/10 and 169.254.0.0/16: RFC 4291, RFC 3927.
  const bool inLinkLocalRange = isIPv6 ? address.address.starts_with("fe8") || address.address.starts_with("fe9") ||
                                             address.address.starts_with("fea") || address.address.starts_with("feb")
                                       : address.address.starts_with("169.254.");
  if (inLinkLocalRange || protocol == kLinkLocal) return AddressOrigin::LinkLocal;
  if (protocol == kFromRouter) return AddressOrigin::Slaac;
  if ((flags & IFA_F_PERMANENT) != 0) return AddressOrigin::Static;
  // With a lifetime that the kernel did not set: a daemon got it from a router (those addresses cover the half of 128
  // bits that SLAAC generates, or are temporary ones beside such) or from DHCP.
  constexpr unsigned int kSlaacPrefix = 64;
  const bool temporary = (flags & (IFA_F_TEMPORARY | IFA_F_MANAGETEMPADDR)) != 0;
  if (isIPv6 && (temporary || address.prefixLength == kSlaacPrefix)) return AddressOrigin::Slaac;
  return AddressOrigin::Dhcp;
}

LinkMonitor::LinkMonitor() : socket_(nullptr, &::mnl_socket_close) {}

bool LinkMonitor::open() {
  socket_ = openSocket(RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR);
  return socket_ != nullptr;
}

bool LinkMonitor::changed() {
  if (socket_ == nullptr) return true;
  bool changed = false;
  for (int reports = 0; reports < kMostReports; ++reports) {
    char ignored = 0;
    const ssize_t got = ::recv(::mnl_socket_get_fd(socket_.get()), &ignored, sizeof ignored, MSG_DONTWAIT | MSG_TRUNC);
    if (got < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) return changed;
    // Anything else is an event, or says that events were lost (ENOBUFS).
    changed = true;
    if (got < 0 && errno != ENOBUFS && errno != EINTR) return changed;
  }
  return changed;
}

LinkReader::LinkReader() : socket_(nullptr, &::mnl_socket_close) {}

void LinkReader::close() { socket_.reset(); }

void LinkReader::open() {
  buffer_.resize(kBufferSize);
  socket_ = openSocket(0);
  if (socket_ == nullptr) fail("a netlink socket cannot be opened");
  ::setsockopt(::mnl_socket_get_fd(socket_.get()), SOL_SOCKET, SO_RCVTIMEO, &kLongestAnswer, sizeof kLongestAnswer);
}

LinkTable LinkReader::read() {
  if (socket_ == nullptr) open();
  try {
    LinkTable table;
    const auto takeLink = [&table](const nlmsghdr* message) {
      Link link;
      if (parseLink(message, link)) table.links.push_back(std::move(link));
    };
    const auto takeAddress = [&table](const nlmsghdr* message) {
      LinkAddress address;
      if (parseAddress(message, address)) table.addresses.push_back(std::move(address));
    };
    dump(RTM_GETLINK, takeLink, [&table] { table.links.clear(); });
    dump(RTM_GETADDR, takeAddress, [&table] { table.addresses.clear(); });
    return table;
  } catch (...) {
    // A part of a response may still be in the socket.
    close();
    throw;
  }
}

void LinkReader::dump(unsigned short type, const Handler& handle, const std::function<void()>& startAgain) {
  for (int dumps = 0; dumps < kMostDumps; ++dumps) {
    startAgain();
    request(type);
    if (receive(handle) == DumpResult::Complete) return;
  }
}

void LinkReader::request(unsigned short type) {
  std::array<char, 64> room{};
  nlmsghdr* message = ::mnl_nlmsg_put_header(room.data());
  message->nlmsg_type = type;
  message->nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
  message->nlmsg_seq = ++sequence_;
  if (type == RTM_GETLINK) {
    ::mnl_nlmsg_put_extra_header(message, sizeof(ifinfomsg));
    // Counters and the like are most of a response and are not needed here.
    ::mnl_attr_put_u32(message, IFLA_EXT_MASK, RTEXT_FILTER_SKIP_STATS);
  } else {
    ::mnl_nlmsg_put_extra_header(message, sizeof(ifaddrmsg));
  }
  if (::mnl_socket_sendto(socket_.get(), message, message->nlmsg_len) < 0) fail("the kernel cannot be asked");
}

LinkReader::DumpResult LinkReader::receive(const Handler& handle) {
  DumpResult result = DumpResult::Complete;
  for (;;) {
    const ssize_t got = ::mnl_socket_recvfrom(socket_.get(), buffer_.data(), buffer_.size());
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) fail("the kernel's answer cannot be read");
    int left = static_cast<int>(got);
    const auto* message = reinterpret_cast<const nlmsghdr*>(buffer_.data());
    for (; ::mnl_nlmsg_ok(message, left); message = ::mnl_nlmsg_next(message, &left)) {
      if (message->nlmsg_seq != sequence_) continue;
      if ((message->nlmsg_flags & NLM_F_DUMP_INTR) != 0) result = DumpResult::Interrupted;
      if (message->nlmsg_type == NLMSG_DONE || message->nlmsg_type == NLMSG_ERROR) {
        errno = errorOf(message);
        if (errno != 0) fail("the kernel refuses to tell its interfaces");
        return result;
      }
      handle(message);
    }
  }
}

}  // namespace zorva::agent
