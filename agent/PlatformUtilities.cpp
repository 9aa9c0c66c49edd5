#include "agent/interface/PlatformUtilities.h"

#include "agent/Runtime.h"

namespace ZV {

const char* PlatformUtilities::getMaroviaDataDir() { return zorvagent::Runtime::instance().config().dataDir.c_str(); }

std::string getSystemName() { return zorvagent::Runtime::instance().systemName(); }

}  // namespace ZV
