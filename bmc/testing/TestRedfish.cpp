#include "bmc/testing/TestRedfish.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>

namespace zorva::bmc::testing {

namespace {

constexpr const char* kLoopback = "127.0.0.1";

}  // namespace

TestRedfish::TestRedfish(const std::string& mockup)
    : authority_(directory_, "authority"), files_(authority_.issue("redfish", {"redfish", {kLoopback}})) {
  int to[2];
  int from[2];
  if (::pipe2(to, O_CLOEXEC) != 0 || ::pipe2(from, O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
  process_ = ::fork();
  if (process_ == 0) {
    ::dup2(to[0], STDIN_FILENO);
    ::dup2(from[1], STDOUT_FILENO);
    ::execlp("python3", "python3", ZORVA_SOURCE_DIR "/tests/redfish/service.py", files_.certificate.c_str(),
             files_.key.c_str(), "--schemas", ZORVA_REDFISH_SCHEMA_DIR, "--mockup", mockup.c_str(), nullptr);
    ::_exit(127);
  }
  ::close(to[0]);
  ::close(from[1]);
  toIt_ = ::fdopen(to[1], "w");
  fromIt_ = ::fdopen(from[0], "r");
  port_ = readLine();
  if (port_.empty()) throw std::runtime_error("the Redfish service does not start");
  directory_.write("password", std::string(kPassword) + "\n");
  ::chmod((directory_ / "password").c_str(), 0600);
  directory_.write("run/.keep", "");
}

TestRedfish::~TestRedfish() { stop(); }

void TestRedfish::stop() {
  if (process_ <= 0) return;
  std::fclose(toIt_);
  std::fclose(fromIt_);
  ::kill(process_, SIGTERM);
  ::waitpid(process_, nullptr, 0);
  process_ = -1;
}

std::string TestRedfish::readLine() {
  std::string line;
  for (int c = std::fgetc(fromIt_); c != EOF && c != '\n'; c = std::fgetc(fromIt_)) line += static_cast<char>(c);
  return line;
}

json TestRedfish::tell(const json& command) {
  std::fputs((command.dump() + "\n").c_str(), toIt_);
  std::fflush(toIt_);
  return json::parse(readLine());
}

std::vector<std::string> TestRedfish::requests() {
  std::vector<std::string> lines;
  for (const json& each : tell({{"log", true}})) {
    const std::string path = each["path"].get<std::string>();
    lines.push_back(each["method"].get<std::string>() + " " + path.substr(0, path.find('?')));
  }
  return lines;
}

json TestRedfish::patches() {
  json found = json::array();
  for (const json& each : tell({{"log", true}})) {
    if (each["method"] == "PATCH") found.push_back(each);
  }
  return found;
}

void TestRedfish::changeCertificate() {
  files_ = authority_.issue("other", {"redfish", {kLoopback}});
  tell({{"certificate", files_.certificate}, {"key", files_.key}});
}

agent::BmcConfig TestRedfish::config() const {
  agent::BmcConfig config;
  config.url = url();
  config.user = "operator";
  config.passwordFile = directory_ / "password";
  config.caFile = authority();
  config.file = bmcJson();
  return config;
}

std::string TestRedfish::configFile(const std::string& before) const {
  const agent::BmcConfig values = config();
  return directory_.write("agent.toml", before + "\n[bmc]\nurl = \"" + values.url + "\"\nuser = \"" + values.user +
                                            "\"\npassword_file = \"" + values.passwordFile + "\"\nca_file = \"" +
                                            values.caFile + "\"\nfile = \"" + values.file + "\"\n");
}

}  // namespace zorva::bmc::testing
