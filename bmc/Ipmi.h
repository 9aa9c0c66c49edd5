#pragma once

// Commands to the management controller (IPMI 2.0) through the kernel's driver, <linux/ipmi.h>.

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "bmc/Https.h"

namespace zorva::bmc {

/// Something is not there, and asking again does not help.
class NotOffered : public Failed {
 public:
  using Failed::Failed;
};

struct IpmiCommand {
  std::uint8_t netFn = 0;
  std::uint8_t command = 0;
  std::string data;
};

class Ipmi : util::NotCopied {
 public:
  virtual ~Ipmi() = default;

  /// The answer's data from its completion code on. They may be any bytes, or none. Throws NotOffered if the host has
  /// no device for it, and Failed if the device cannot be used or nothing answers in time.
  virtual std::string ask(const IpmiCommand& command) = 0;
};

/// The first of these devices that is there. It is opened for each command.
std::unique_ptr<Ipmi> makeIpmiDevice(std::vector<std::string> devices = {"/dev/ipmi0", "/dev/ipmi/0",
                                                                         "/dev/ipmidev/0"});

}  // namespace zorva::bmc
