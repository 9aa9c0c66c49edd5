#include "server/testing/TestDaemon.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <stdexcept>
#include <thread>

#include "agent/testing/Program.h"
#include "http/testing/TestWire.h"

namespace zorva::server::testing {

namespace {

using Clock = std::chrono::steady_clock;
using zorva::agent::testing::commandOf;
using zorva::agent::testing::contentsOf;
using zorva::agent::testing::Program;

constexpr const char* kTree = R"({"system_name":"host1","nodes":[
  {"type":"System","name":"system","description":"Computer","children":[
    {"type":"Port","name":"eth0","description":"","children":[
      {"type":"NetworkIPConfig","name":"ip","description":"","properties":{
        "name":"eth0","host_name":"host1","domain_name":"example.org","dns_suffixes":["example.org"],
        "dns_server_addresses":["192.0.2.53"],"protocol_if_type":4097,"enabled_state":1}}]}]}]})";

int exitCodeOf(int status) { return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status); }

/// The first line that arrives, or the text received until the time is over.
std::string firstLine(int descriptor, std::chrono::seconds most) {
  const auto deadline = Clock::now() + most;
  std::string text;
  while (text.find('\n') == std::string::npos && Clock::now() < deadline) {
    pollfd wait{descriptor, POLLIN, 0};
    if (::poll(&wait, 1, 100) <= 0) continue;
    char buffer[512];
    const ssize_t got = ::read(descriptor, buffer, sizeof buffer);
    if (got <= 0) break;
    text.append(buffer, static_cast<std::size_t>(got));
  }
  return text;
}

/// The port of the first address of that scheme; 0 if there is none.
int portIn(const std::string& line, const std::string& scheme) {
  const std::size_t begin = line.find(scheme);
  if (begin == std::string::npos) return 0;
  const std::size_t end = line.find_first_of(" \n", begin);
  return std::atoi(line.c_str() + line.rfind(':', end) + 1);
}

}  // namespace

TestDaemon::TestDaemon(const std::string& config, std::vector<std::string> arguments,
                       const std::function<void()>& prepare) {
  directory_.write("tree.json", kTree);
  directory_.write("data/keep", "");
  directory_.write("agent.toml", "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"\n");
  writeConfig(config);
  if (arguments.empty()) arguments = {"--listen", "127.0.0.1", "--port", "0"};
  arguments.insert(arguments.end(), {"--config", directory_ / "zorvacimd.toml", "--greet"});

  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
  out_ = util::FileDescriptor(ends[0]);
  util::FileDescriptor out(ends[1]);
  const util::FileDescriptor err(
      ::open((directory_ / "stderr").c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600));
  const Program zorvacimd(commandOf(ZORVA_BIN_DIR "/zorvacimd", arguments));
  process_ = ::fork();
  if (process_ == 0) {
    if (prepare) prepare();
    zorvacimd.exec(out.get(), err.get());
  }
  out = util::FileDescriptor();

  const std::string line = firstLine(out_.get(), std::chrono::seconds(60));
  port_ = portIn(line, "http://");
  tlsPort_ = portIn(line, "https://");
  if (line.find("zorvacimd listens on ") == std::string::npos) {
    throw std::runtime_error("zorvacimd does not listen: " + line + contentsOf(directory_ / "stderr"));
  }
}

TestDaemon::~TestDaemon() {
  if (process_ <= 0) return;
  ::kill(process_, SIGTERM);
  if (exitCodeWithin(std::chrono::seconds(30)) >= 0) return;
  ::kill(process_, SIGKILL);
  ::waitpid(process_, nullptr, 0);
}

void TestDaemon::signal(int number) const { ::kill(process_, number); }

int TestDaemon::exitCodeWithin(std::chrono::milliseconds most) {
  const auto deadline = Clock::now() + most;
  while (Clock::now() < deadline) {
    int status = 0;
    if (::waitpid(process_, &status, WNOHANG) == process_) {
      process_ = -1;
      return exitCodeOf(status);
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  return -1;
}

std::string TestDaemon::log() const { return contentsOf(directory_ / "log"); }

bool TestDaemon::logs(const std::string& text) const {
  for (int i = 0; i < 1000; ++i) {
    if (log().find(text) != std::string::npos) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return false;
}

void TestDaemon::writeConfig(const std::string& config) const {
  directory_.write("zorvacimd.toml", "[agent]\nconfig = \"agent.toml\"\nprovider_dir = \"" +
                                         std::string(ZORVA_LIB_DIR) + "\"\n[log]\ntarget = \"log\"\nlevel = 4500\n" +
                                         config);
}

DaemonOutcome TestDaemon::run(const std::vector<std::string>& arguments) {
  const zorva::agent::testing::TemporaryDirectory directory;
  const util::FileDescriptor out(::open((directory / "out").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
  const util::FileDescriptor err(::open((directory / "err").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
  const Program zorvacimd(commandOf(ZORVA_BIN_DIR "/zorvacimd", arguments));
  const pid_t process = ::fork();
  if (process == 0) zorvacimd.exec(out.get(), err.get());
  int status = 0;
  ::waitpid(process, &status, 0);
  return {exitCodeOf(status), contentsOf(directory / "out"), contentsOf(directory / "err")};
}

std::string changeOfDomain() {
  return http::testing::posting(
      "<?xml version=\"1.0\" encoding=\"utf-8\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\">"
      "<MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"SetProperty\"><LOCALNAMESPACEPATH>"
      "<NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"cimv2\"/></LOCALNAMESPACEPATH><IPARAMVALUE NAME=\"InstanceName\">"
      "<INSTANCENAME CLASSNAME=\"ZORVA_DNSProtocolEndPoint\"><KEYBINDING NAME=\"Name\"><KEYVALUE>eth0</KEYVALUE>"
      "</KEYBINDING></INSTANCENAME></IPARAMVALUE><IPARAMVALUE NAME=\"PropertyName\"><VALUE>DomainName</VALUE>"
      "</IPARAMVALUE><IPARAMVALUE NAME=\"NewValue\"><VALUE>example.net</VALUE></IPARAMVALUE></IMETHODCALL></SIMPLEREQ>"
      "</MESSAGE></CIM>",
      "CIMOperation: MethodCall\r\nCIMMethod: SetProperty\r\nCIMObject: root/cimv2\r\n");
}

}  // namespace zorva::server::testing
