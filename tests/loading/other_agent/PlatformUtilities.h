#pragma once

#include <string>

namespace ZV {

class PlatformUtilities {
 public:
  static const char* getMaroviaDataDir();
};

std::string getSystemName();

}  // namespace ZV
