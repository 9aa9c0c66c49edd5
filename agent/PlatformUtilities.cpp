#include "agent/interface/PlatformUtilities.h"

#include "agent/Runtime.h"
#include "agent/config/CurrentConfig.h"

namespace ZV {

const char* PlatformUtilities::getMaroviaDataDir() {
  return zorva::agent::CurrentConfig::instance().get().dataDir.c_str();
}

std::string getSystemName() { return zorva::agent::Runtime::instance().systemName(); }

}  // namespace ZV
