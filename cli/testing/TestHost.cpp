#include "cli/testing/TestHost.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sched.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <stdexcept>

#include "agent/testing/Program.h"
#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

using agent::testing::commandOf;
using agent::testing::Program;

struct Pair {
  int reader;
  int writer;
};

Pair makePipe() {
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
  return {ends[0], ends[1]};
}

/// A terminal of 60 columns: text written to one end is read at the other.
Pair makeTerminal() {
  const int master = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
  if (master < 0 || ::grantpt(master) != 0 || ::unlockpt(master) != 0) throw std::runtime_error("no terminal");
  const int terminal = ::open(::ptsname(master), O_RDWR | O_NOCTTY | O_CLOEXEC);
  winsize size{};
  size.ws_col = 60;
  size.ws_row = 24;
  ::ioctl(terminal, TIOCSWINSZ, &size);
  return {master, terminal};
}

Pair makeOutput(OutputTo output) {
  if (output == OutputTo::Terminal) return makeTerminal();
  if (output == OutputTo::Pipe || output == OutputTo::ErrorTerminal) return makePipe();
  return {::open("/dev/null", O_RDONLY | O_CLOEXEC), ::open("/dev/full", O_WRONLY | O_CLOEXEC)};
}

/// Reads both to their ends.
void collect(int out, int err, Outcome& outcome) {
  std::array<pollfd, 2> open{{{out, POLLIN, 0}, {err, POLLIN, 0}}};
  std::string* const texts[] = {&outcome.out, &outcome.err};
  for (int left = 2; left > 0;) {
    ::poll(open.data(), open.size(), -1);
    for (std::size_t i = 0; i < open.size(); ++i) {
      if (open[i].fd < 0 || open[i].revents == 0) continue;
      char buffer[4096];
      const ssize_t count = ::read(open[i].fd, buffer, sizeof buffer);
      if (count > 0) {
        texts[i]->append(buffer, static_cast<std::size_t>(count));
      } else {
        ::close(open[i].fd);
        open[i].fd = -1;
        --left;
      }
    }
  }
}

int exitCodeOf(pid_t child) {
  int status = 0;
  ::waitpid(child, &status, 0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

}  // namespace

TestHost::TestHost(const std::vector<std::string>& interfaces) {
  ::unsetenv("NO_COLOR");
  directory_.write("agent.toml", "[agent]\ndata_dir = \"data\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"\n");
  std::filesystem::create_directory(directory_ / "data");
  writeTree(R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
            R"("children": [)" +
            joined(interfaces, ", ") + "]}]}");
}

void TestHost::configure(std::string toml) const {
  for (std::size_t at = toml.find("DIR"); at != std::string::npos; at = toml.find("DIR", at)) {
    toml.replace(at, 3, directory_.path());
  }
  directory_.write("agent.toml", toml);
}

void TestHost::writeTree(const std::string& json) const { directory_.write("tree.json", json); }

std::string TestHost::port(const std::string& name, const std::string& properties) {
  std::string usual =
      R"("name": ")" + name + R"(", "host_name": "host1", "enabled_state": 1, "protocol_if_type": 4097)";
  if (properties.find("dns_server_addresses") == std::string::npos) {
    usual += R"(, "dns_server_addresses": ["192.0.2.53", "2001:db8::53"])";
  }
  if (!properties.empty()) usual += ", " + properties;
  return R"({"type": "Port", "name": ")" + name +
         R"(", "description": "", "children": [{"type": "NetworkIPConfig", "name": "ip", "description": "", )"
         R"("properties": {)" +
         usual + "}}]}";
}

std::vector<std::string> TestHost::twoInterfaces() {
  return {port("eth0", R"("domain_name": "example.org", "dns_suffixes": ["example.org", "example.net"])"),
          port("eth1")};
}

std::vector<std::string> TestHost::manyInterfaces(int count) {
  std::vector<std::string> ports;
  for (int i = 0; i < count; ++i) ports.push_back(port("eth" + std::to_string(i), R"("domain_name": "example.org")"));
  return ports;
}

Outcome TestHost::run(const std::vector<std::string>& words, OutputTo output) const {
  return runWith({}, words, output);
}

Outcome TestHost::runWith(const std::vector<std::pair<std::string, std::string>>& environment,
                          const std::vector<std::string>& words, OutputTo output) const {
  return runPrepared([] { return true; }, environment, words, output);
}

Outcome TestHost::runLimited(std::size_t bytes, AtLimit atLimit, const std::vector<std::string>& words) const {
  const auto limit = [&] {
    const rlimit size{bytes, bytes};
    const rlimit noCore{0, 0};
    ::signal(SIGXFSZ, atLimit == AtLimit::WriteFails ? SIG_IGN : SIG_DFL);
    return ::setrlimit(RLIMIT_FSIZE, &size) == 0 && ::setrlimit(RLIMIT_CORE, &noCore) == 0;
  };
  return runPrepared(limit, {}, words, OutputTo::Pipe);
}

Outcome TestHost::runOnFreshMachine(const std::vector<std::string>& words) const {
  const auto hide = [] {
    return ::geteuid() == 0 && ::unshare(CLONE_NEWNS) == 0 &&
           ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
           ::mount("none", "/var/lib", "tmpfs", 0, "size=1m") == 0;
  };
  return runPrepared(hide, {}, words, OutputTo::Pipe);
}

Outcome TestHost::runUnprivileged(const std::vector<std::string>& words, unsigned mode) const {
  const unsigned unprivileged = 65534;
  const bool isRoot = ::geteuid() == 0;
  ::chmod(directory_.path().c_str(), 0755);
  ::chmod(dataFile("").c_str(), isRoot ? mode : mode & 0555U);
  const auto become = [&] { return !isRoot || (::setgid(unprivileged) == 0 && ::setuid(unprivileged) == 0); };
  Outcome outcome = runPrepared(become, {}, words, OutputTo::Pipe);
  ::chmod(dataFile("").c_str(), 0755);
  return outcome;
}

Outcome TestHost::runWithInput(const std::string& input, const std::vector<std::string>& words) const {
  const Pair pipe = makePipe();
  const bool isWritten = ::write(pipe.writer, input.data(), input.size()) == static_cast<ssize_t>(input.size());
  ::close(pipe.writer);
  Outcome outcome =
      runPrepared([&] { return isWritten && ::dup2(pipe.reader, STDIN_FILENO) >= 0; }, {}, words, OutputTo::Pipe);
  ::close(pipe.reader);
  return outcome;
}

Outcome TestHost::runAtTerminal(const std::vector<std::string>& words, const std::vector<std::string>& questions,
                                const std::vector<std::string>& answers) const {
  const Program zorvactl(commandOf(ZORVA_BIN_DIR "/zorvactl", words),
                         {{"ZORVAGENT_CONFIG", directory_ / "agent.toml"}, {"TERM", "dumb"}});
  int master = -1;
  const pid_t child = ::forkpty(&master, nullptr, nullptr, nullptr);
  if (child < 0) throw std::runtime_error("no terminal");
  if (child == 0) zorvactl.exec(STDOUT_FILENO, STDERR_FILENO);
  Outcome outcome;
  std::size_t next = 0;
  char buffer[256];
  for (ssize_t count = 0; (count = ::read(master, buffer, sizeof buffer)) > 0;) {
    outcome.out.append(buffer, static_cast<std::size_t>(count));
    if (next == questions.size() || !outcome.out.ends_with(questions[next])) continue;
    const std::string answer = answers[next++] + "\n";
    if (::write(master, answer.data(), answer.size()) < 0) throw std::runtime_error("nothing can be typed");
  }
  ::close(master);
  outcome.exitCode = exitCodeOf(child);
  return outcome;
}

Outcome TestHost::runPrepared(const std::function<bool()>& prepare, const Environment& environment,
                              const std::vector<std::string>& words, OutputTo output) const {
  Environment variables = environment;
  variables.emplace_back("ZORVAGENT_CONFIG", directory_ / "agent.toml");
  variables.emplace_back("TERM", "xterm");
  const Program zorvactl(commandOf(ZORVA_BIN_DIR "/zorvactl", words), variables);
  const Pair out = makeOutput(output);
  const Pair err = output == OutputTo::ErrorTerminal ? makeTerminal() : makePipe();
  const pid_t child = ::fork();
  if (child < 0) throw std::runtime_error("no process");
  if (child == 0) {
    ::dup2(::open("/dev/null", O_RDONLY), STDIN_FILENO);
    if (!prepare()) ::_exit(127);
    zorvactl.exec(out.writer, err.writer);
  }
  ::close(out.writer);
  ::close(err.writer);
  Outcome outcome;
  collect(out.reader, err.reader, outcome);
  outcome.exitCode = exitCodeOf(child);
  return outcome;
}

}  // namespace zorva::cli
