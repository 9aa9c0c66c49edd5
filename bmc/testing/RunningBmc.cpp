#include "bmc/testing/RunningBmc.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <thread>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::bmc::testing {

using agent::testing::contentsOf;

RunningBmc::RunningBmc(const TestRedfish& redfish, const std::string& config)
    : log_(redfish.directory() / "log"), socket_(agent::bmcSocketBeside(redfish.bmcJson())) {
  process_ = ::fork();
  if (process_ == 0) {
    ::dup2(::open(log_.c_str(), O_CREAT | O_WRONLY | O_TRUNC, 0600), STDERR_FILENO);
    ::execl(ZORVA_BIN_DIR "/zorva-bmc", "zorva-bmc", "--config", config.c_str(), nullptr);
    ::_exit(127);
  }
  for (int turn = 0; turn < 1500 && ::access(redfish.bmcJson().c_str(), F_OK) != 0; ++turn) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
}

int RunningBmc::stop() {
  int status = -1;
  if (process_ <= 0) return status;
  ::kill(process_, SIGTERM);
  ::waitpid(process_, &status, 0);
  process_ = -1;
  return status;
}

std::string RunningBmc::inProc(const std::string& name) const {
  return contentsOf("/proc/" + std::to_string(process_) + "/" + name);
}

std::string RunningBmc::log() const { return contentsOf(log_); }

}  // namespace zorva::bmc::testing
