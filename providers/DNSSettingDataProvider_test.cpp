// ZORVA_DNSSettingData as a CIM server reads it.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <array>

#include "ProviderCall.h"
#include "World.h"

extern "C" CMPIInstanceMI* DNSSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const Path kClass("ZORVA_DNSSettingData");
Path id(const char* instanceID) { return kClass.key("InstanceID", instanceID); }

// How often a file is opened from here on.
class OpenCounter {
 public:
  explicit OpenCounter(const std::string& path) : inotify_(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
    ::inotify_add_watch(inotify_, path.c_str(), IN_OPEN);
  }
  ~OpenCounter() { ::close(inotify_); }
  OpenCounter(const OpenCounter&) = delete;
  OpenCounter& operator=(const OpenCounter&) = delete;

  // Equal reports that follow one another are merged by the kernel, so each is to be taken before the next open.
  bool wasOpened() {
    std::array<char, 4096> reports;
    return ::read(inotify_, reports.data(), reports.size()) > 0;
  }

 private:
  int inotify_;
};

class DNSSettingDataProviderTest : public ::testing::Test {
 protected:
  std::string fileLine(const std::string& nic) const { return "log 4000 VARIABLE fileName = " + world_.filePath(nic); }
  std::vector<Value> idsOf(const Outcome& outcome) const {
    std::vector<Value> ids;
    for (const Instance& instance : outcome.instances()) ids.push_back(instance["InstanceID"]);
    return ids;
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSSettingDataProvider_Create_InstanceMI, broker_};
};

}  // namespace
}  // namespace ZV::Test
