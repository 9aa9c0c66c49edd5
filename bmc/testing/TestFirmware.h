#pragma once

// For tests: structures of the firmware's table (DSP0134, DSP0270), and a management controller that answers over IPMI.

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "bmc/Ipmi.h"

namespace zorva::bmc::testing {

inline std::string structure(int type, const std::string& data, const std::string& texts = std::string(2, '\0')) {
  return std::string{static_cast<char>(type), static_cast<char>(4 + data.size()), 0, 0} + data + texts;
}

/// The record of a Redfish service over IP.
inline std::string record(int format, const std::string& address, int port) {
  std::string data(91, '\0');
  data[51] = static_cast<char>(format);
  data.replace(52, address.size(), address);
  data[84] = static_cast<char>(port & 0xFF);
  data[85] = static_cast<char>(port >> 8);
  return data;
}

inline std::string controller(const std::string& data, int protocol = 4, int interfaceType = 0x40) {
  return structure(42, std::string{static_cast<char>(interfaceType), 2, 2, 0, 1, static_cast<char>(protocol),
                                   static_cast<char>(data.size())} +
                           data);
}

/// Answers to commands, with what was asked.
class FakeIpmi : public Ipmi {
 public:
  using Answer = std::function<std::string(const IpmiCommand&)>;

  explicit FakeIpmi(Answer answer) : answer_(std::move(answer)) {}

  std::string ask(const IpmiCommand& command) override {
    asked.push_back(command);
    return answer_(command);
  }

  std::vector<IpmiCommand> asked;

 private:
  const Answer answer_;
};

}  // namespace zorva::bmc::testing
