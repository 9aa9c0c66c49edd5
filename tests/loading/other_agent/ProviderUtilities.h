#pragma once

#include <string>

namespace ZV {

class ProviderUtilities {
 public:
  static unsigned short ValidateInput(std::string value, std::string other);
};

}  // namespace ZV
