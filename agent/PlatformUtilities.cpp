#include "agent/interface/PlatformUtilities.h"

#include "agent/Runtime.h"

namespace ZV {

const char* PlatformUtilities::getMaroviaDataDir() {
  return zorva::agent::Runtime::instance().config().dataDir.c_str();
}

std::string getSystemName() { return zorva::agent::Runtime::instance().systemName(); }

}  // namespace ZV
