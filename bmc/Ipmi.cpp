#include "bmc/Ipmi.h"

#include <fcntl.h>
#include <linux/ipmi.h>
#include <poll.h>
#include <string.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include "util/FileDescriptor.h"

namespace zorva::bmc {

namespace {

constexpr long kMessage = 1;  ///< its number on the open device; there is one at a time

class IpmiDevice : public Ipmi {
 public:
  explicit IpmiDevice(std::vector<std::string> devices) : devices_(std::move(devices)) {}

  std::string ask(const IpmiCommand& command) override {
    std::string name;
    const util::FileDescriptor device = open(name);
    send(device.get(), name, command);
    return receive(device.get(), name);
  }

 private:
  util::FileDescriptor open(std::string& name) const {
    for (const std::string& each : devices_) {
      util::FileDescriptor device(::open(each.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK));
      name = each;
      if (device) return device;
      if (errno != ENOENT && errno != ENOTDIR && errno != ENXIO && errno != ENODEV) fail(each, "cannot be opened");
    }
    throw NotOffered("this host has no IPMI device (" + devices_.front() +
                     "); if it should have one, load the kernel's module ipmi_devintf");
  }

  static void send(int device, const std::string& name, const IpmiCommand& command) {
    ipmi_system_interface_addr address{IPMI_SYSTEM_INTERFACE_ADDR_TYPE, IPMI_BMC_CHANNEL, 0};
    std::string data = command.data;
    ipmi_req request{};
    request.addr = reinterpret_cast<unsigned char*>(&address);
    request.addr_len = sizeof address;
    request.msgid = kMessage;
    request.msg = {command.netFn, command.command, static_cast<unsigned short>(data.size()),
                   reinterpret_cast<unsigned char*>(data.data())};
    if (::ioctl(device, IPMICTL_SEND_COMMAND, &request) != 0) fail(name, "takes no command");
  }

  /// Events go to everybody who has the device open, and are left aside.
  static std::string receive(int device, const std::string& name) {
    constexpr std::chrono::seconds kLongest{10};
    std::array<unsigned char, 256> buffer{};
    const auto end = Clock::now() + kLongest;
    for (;;) {
      const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now()).count();
      pollfd entry{device, POLLIN, 0};
      const int ready = left <= 0 ? 0 : ::poll(&entry, 1, static_cast<int>(left));
      if (ready == 0) throw Failed(name + ": the management controller does not answer in time");
      if (ready < 0 && errno != EINTR) fail(name, "cannot be waited for");
      if (ready < 0) continue;
      if ((entry.revents & POLLIN) == 0) throw Failed(name + ": gives no answer");
      ipmi_addr address{};
      ipmi_recv message{};
      message.addr = reinterpret_cast<unsigned char*>(&address);
      message.addr_len = sizeof address;
      message.msg.data = buffer.data();
      message.msg.data_len = buffer.size();
      const bool isReceived = ::ioctl(device, IPMICTL_RECEIVE_MSG_TRUNC, &message) == 0;
      if (!isReceived && errno != EAGAIN && errno != EINTR) fail(name, "gives no answer");
      if (!isReceived || message.recv_type != IPMI_RESPONSE_RECV_TYPE || message.msgid != kMessage) continue;
      std::string data(buffer.begin(), buffer.begin() + std::min<std::size_t>(message.msg.data_len, buffer.size()));
      ::explicit_bzero(buffer.data(), buffer.size());  // it may hold a password
      return data;
    }
  }

  [[noreturn]] static void fail(const std::string& name, const char* what) {
    throw Failed(name + ": " + what + ": " + std::generic_category().message(errno));
  }

  const std::vector<std::string> devices_;
};

}  // namespace

std::unique_ptr<Ipmi> makeIpmiDevice(std::vector<std::string> devices) {
  return std::make_unique<IpmiDevice>(std::move(devices));
}

}  // namespace zorva::bmc
