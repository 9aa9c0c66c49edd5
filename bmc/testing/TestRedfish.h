#pragma once

// For tests: the Redfish service of tests/redfish as a process, with an authority of its own.

#include <sys/types.h>

#include <cstdio>
#include <nlohmann/json.hpp>
#include <string>

#include "agent/config/Config.h"
#include "agent/testing/TemporaryDirectory.h"
#include "bmc/Service.h"
#include "http/testing/TestCertificates.h"
#include "util/NotCopied.h"

namespace zorva::bmc::testing {

using nlohmann::json;

inline constexpr const char* kPassword = "correct horse";
inline constexpr const char* kEth0 = "/redfish/v1/Managers/1/EthernetInterfaces/eth0";

class TestRedfish : util::NotCopied {
 public:
  /// Answers as the mockup in that folder does; without one, as tests/redfish/world.json has it.
  explicit TestRedfish(const std::string& mockup = {});
  ~TestRedfish();

  /// A command or switches; see service.py.
  json tell(const json& command);

  /// The requests since the last time, as "GET /redfish/v1/", without the queries.
  std::vector<std::string> requests();

  /// The PATCH requests among the requests since the last time: "method", "path", "If-Match" and "body".
  json patches();

  /// From now on its certificate is another one of the same authority.
  void changeCertificate();

  /// Ends it.
  void stop();

  std::string url() const { return "https://127.0.0.1:" + port_; }
  const std::string& certificate() const { return files_.certificate; }
  const std::string& authority() const { return authority_.file(); }

  /// A configuration for it; the file is "run/bmc.json" in the directory.
  agent::BmcConfig config() const;
  /// The same as a file, with the rest of the agent's configuration before it.
  std::string configFile(const std::string& before) const;

  const agent::testing::TemporaryDirectory& directory() const { return directory_; }
  std::string bmcJson() const { return directory_ / "run/bmc.json"; }

 private:
  std::string readLine();

  agent::testing::TemporaryDirectory directory_;
  http::testing::TestAuthority authority_;
  http::testing::IssuedFiles files_;
  pid_t process_ = -1;
  std::FILE* toIt_ = nullptr;
  std::FILE* fromIt_ = nullptr;
  std::string port_;
};

}  // namespace zorva::bmc::testing
