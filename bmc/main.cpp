#include <signal.h>
#include <sys/prctl.h>
#include <sys/resource.h>

#include <cstdio>
#include <exception>
#include <string_view>

#include "bmc/HostInterface.h"
#include "bmc/Service.h"
#include "bmc/Target.h"

namespace {

using namespace zorva;  // NOLINT(google-build-using-namespace)

bmc::Service* running = nullptr;

constexpr const char* kUsage =
    "usage: zorva-bmc [--once] [--config FILE]\n"
    "Reads the DNS client settings of this host's service processor over Redfish, for the agent.\n"
    "  --once         reads once and ends; exit status 1 if that failed\n"
    "  --config FILE  the agent's configuration, with a table [bmc]\n"
    "  --version, --help\n";

/// The password must not be in a core file, nor be read by a debugger of another process.
void keepSecrets() {
  const rlimit none{0, 0};
  ::setrlimit(RLIMIT_CORE, &none);
  ::prctl(PR_SET_DUMPABLE, 0);
}

void stopAtSignals() {
  struct sigaction action {};
  action.sa_handler = [](int) { running->stop(); };
  for (const int number : {SIGTERM, SIGINT}) ::sigaction(number, &action, nullptr);
}

struct Options {
  bool once = false;
  std::string config;
};

/// False: the program ends with that status.
bool read(int argc, char** argv, Options& options, int& status) {
  for (int i = 1; i < argc; ++i) {
    const std::string_view word = argv[i];
    if (word == "--once") {
      options.once = true;
    } else if (word == "--config" && i + 1 < argc) {
      options.config = argv[++i];
    } else if (word == "--version" || word == "--help") {
      std::fputs(word == "--help" ? kUsage : "zorva-bmc " ZORVA_VERSION "\n", stdout);
      status = 0;
      return false;
    } else {
      std::fputs(kUsage, stderr);
      status = 2;
      return false;
    }
  }
  return true;
}

int serve(const Options& options) {
  const agent::Config config = options.config.empty() ? agent::readDefaultConfig() : agent::readConfig(options.config);
  bmc::Service service(config.bmc, bmc::findTarget(config.bmc, bmc::kSmbiosTable, bmc::makeIpmiDevice()));
  running = &service;
  stopAtSignals();
  bool done = true;
  if (options.once) {
    done = service.readOnce();
  } else {
    service.run();
  }
  service.logOut();
  return done ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  keepSecrets();
  Options options;
  int status = 0;
  if (!read(argc, argv, options, status)) return status;
  try {
    return serve(options);
  } catch (const bmc::NotOffered& error) {
    // A service that was started again would find the same.
    std::fprintf(stderr, "zorva-bmc: %s\n", error.what());
    return options.once ? 1 : 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "zorva-bmc: %s\n", error.what());
    return 1;
  }
}
