#include "util/HostName.h"

#include <sys/utsname.h>

namespace zorva::util {

std::string kernelHostName() {
  utsname name{};
  return ::uname(&name) == 0 ? name.nodename : "";
}

}  // namespace zorva::util
