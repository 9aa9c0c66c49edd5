#include "agent/testing/NetworkNamespace.h"

#include <arpa/inet.h>
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sched.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent::testing {
namespace {

// A request in the making: a message with room for its attributes.
class Message {
 public:
  Message(unsigned short type, unsigned short flags) : message_(::mnl_nlmsg_put_header(room_.data())) {
    message_->nlmsg_type = type;
    message_->nlmsg_flags = static_cast<unsigned short>(NLM_F_REQUEST | NLM_F_ACK | flags);
    message_->nlmsg_seq = 1;
  }

  template <typename Header>
  Header* header() {
    return static_cast<Header*>(::mnl_nlmsg_put_extra_header(message_, sizeof(Header)));
  }

  operator nlmsghdr*() { return message_; }

 private:
  alignas(nlmsghdr) std::array<char, 1024> room_{};
  nlmsghdr* message_;
};

int indexOf(const std::string& name) {
  const unsigned int index = ::if_nametoindex(name.c_str());
  if (index == 0) throw std::runtime_error("there is no interface " + name);
  return static_cast<int>(index);
}

}  // namespace

bool enterNewNetwork() {
  if (::unshare(CLONE_NEWNET) == 0) return true;
  return ::unshare(CLONE_NEWUSER | CLONE_NEWNET) == 0;
}

bool canMakeNetworks() {
  return succeedsInChild([] { return enterNewNetwork(); });
}

Interfaces::Interfaces() : socket_(::mnl_socket_open2(NETLINK_ROUTE, SOCK_CLOEXEC), &::mnl_socket_close) {
  if (socket_ == nullptr || ::mnl_socket_bind(socket_.get(), 0, MNL_SOCKET_AUTOPID) != 0) {
    throw std::runtime_error("no netlink socket");
  }
}

void Interfaces::send(nlmsghdr* message, const char* what) {
  alignas(nlmsghdr) std::array<char, 8192> answer;
  if (::mnl_socket_sendto(socket_.get(), message, message->nlmsg_len) < 0) throw std::runtime_error(what);
  const ssize_t got = ::mnl_socket_recvfrom(socket_.get(), answer.data(), answer.size());
  if (got < 0 || ::mnl_cb_run(answer.data(), static_cast<std::size_t>(got), 1, 0, nullptr, nullptr) < 0) {
    throw std::runtime_error(std::string(what) + ": " + std::strerror(errno));
  }
}

void Interfaces::addBridge(const std::string& name, unsigned int group) {
  Message message(RTM_NEWLINK, NLM_F_CREATE | NLM_F_EXCL);
  message.header<ifinfomsg>()->ifi_family = AF_UNSPEC;
  ::mnl_attr_put_strz(message, IFLA_IFNAME, name.c_str());
  nlattr* info = ::mnl_attr_nest_start(message, IFLA_LINKINFO);
  ::mnl_attr_put_strz(message, IFLA_INFO_KIND, "bridge");
  ::mnl_attr_nest_end(message, info);
  if (group != 0) ::mnl_attr_put_u32(message, IFLA_GROUP, group);
  send(message, "a bridge cannot be made");
}

void Interfaces::addPair(const std::string& name, const std::string& other) {
  constexpr unsigned short kPeer = 1;  // VETH_INFO_PEER
  Message message(RTM_NEWLINK, NLM_F_CREATE | NLM_F_EXCL);
  message.header<ifinfomsg>()->ifi_family = AF_UNSPEC;
  ::mnl_attr_put_strz(message, IFLA_IFNAME, name.c_str());
  nlattr* info = ::mnl_attr_nest_start(message, IFLA_LINKINFO);
  ::mnl_attr_put_strz(message, IFLA_INFO_KIND, "veth");
  nlattr* data = ::mnl_attr_nest_start(message, IFLA_INFO_DATA);
  nlattr* peer = ::mnl_attr_nest_start(message, kPeer);
  message.header<ifinfomsg>()->ifi_family = AF_UNSPEC;
  ::mnl_attr_put_strz(message, IFLA_IFNAME, other.c_str());
  ::mnl_attr_nest_end(message, peer);
  ::mnl_attr_nest_end(message, data);
  ::mnl_attr_nest_end(message, info);
  send(message, "a pair of links cannot be made");
}

void Interfaces::removeGroup(unsigned int group) {
  Message message(RTM_DELLINK, 0);
  message.header<ifinfomsg>()->ifi_family = AF_UNSPEC;
  ::mnl_attr_put_u32(message, IFLA_GROUP, group);
  send(message, "a group of links cannot be removed");
}

void Interfaces::remove(const std::string& name) {
  Message message(RTM_DELLINK, 0);
  message.header<ifinfomsg>()->ifi_index = indexOf(name);
  send(message, "a link cannot be removed");
}

void Interfaces::rename(const std::string& from, const std::string& to) {
  Message message(RTM_NEWLINK, 0);
  message.header<ifinfomsg>()->ifi_index = indexOf(from);
  ::mnl_attr_put_strz(message, IFLA_IFNAME, to.c_str());
  send(message, "a link cannot be renamed");
}

void Interfaces::setUp(const std::string& name, bool up) {
  Message message(RTM_NEWLINK, 0);
  auto* header = message.header<ifinfomsg>();
  header->ifi_index = indexOf(name);
  header->ifi_change = IFF_UP;
  header->ifi_flags = up ? IFF_UP : 0;
  send(message, "a link cannot be set up or down");
}

void Interfaces::addAddress(const std::string& name, const std::string& address, unsigned char prefixLength,
                            unsigned int flags, unsigned int validSeconds) {
  const bool isIPv6 = address.find(':') != std::string::npos;
  const int family = isIPv6 ? AF_INET6 : AF_INET;
  std::array<unsigned char, sizeof(in6_addr)> binary;
  if (::inet_pton(family, address.c_str(), binary.data()) != 1) throw std::runtime_error("no address");
  const std::size_t size = isIPv6 ? sizeof(in6_addr) : sizeof(in_addr);

  Message message(RTM_NEWADDR, NLM_F_CREATE | NLM_F_EXCL);
  auto* header = message.header<ifaddrmsg>();
  header->ifa_family = static_cast<unsigned char>(family);
  header->ifa_prefixlen = prefixLength;
  header->ifa_index = static_cast<unsigned int>(indexOf(name));
  ::mnl_attr_put(message, IFA_LOCAL, size, binary.data());
  ::mnl_attr_put(message, IFA_ADDRESS, size, binary.data());
  ::mnl_attr_put_u32(message, IFA_FLAGS, flags);
  if (validSeconds != 0) {
    const ifa_cacheinfo lifetime{validSeconds, validSeconds, 0, 0};
    ::mnl_attr_put(message, IFA_CACHEINFO, sizeof lifetime, &lifetime);
  }
  send(message, "an address cannot be added");
}

}  // namespace zorva::agent::testing
