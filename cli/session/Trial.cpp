#include "cli/session/Trial.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <exception>
#include <filesystem>
#include <optional>
#include <vector>

#include "agent/Agent.h"
#include "agent/SettingsLock.h"
#include "agent/apply/Apply.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"

extern char** environ;  // NOLINT(readability-redundant-declaration)

namespace zorva::cli {

namespace {

using Clock = std::chrono::steady_clock;

/// Waits until the descriptor can be read, at most so long. A negative descriptor is only waited for.
bool canRead(int descriptor, std::chrono::milliseconds longest) {
  pollfd polled{descriptor, POLLIN, 0};
  return ::poll(&polled, 1, static_cast<int>(longest.count())) > 0;
}

/// Whether a line came; nothing at the end of the input.
std::optional<bool> readLine(int descriptor) {
  char bytes[256];
  const ssize_t count = ::read(descriptor, bytes, sizeof bytes);
  if (count < 0) return errno == EINTR ? std::optional(false) : std::nullopt;
  if (count == 0) return std::nullopt;
  return std::memchr(bytes, '\n', static_cast<std::size_t>(count)) != nullptr;
}

Failure cannotGuard(int error) {
  return {ExitCode::Failed,
          std::string("nothing was applied: the process that would take it back cannot be started: ") +
              std::strerror(error)};
}

/// This program again, in a session of its own so that the terminal's end does not reach it.
int startGuard(const Globals& globals, int input) {
  std::vector<std::string> words{"zorvactl"};
  if (!globals.config.empty()) words.insert(words.end(), {"--config", globals.config});
  words.emplace_back("guard-trial");
  std::vector<char*> arguments;
  for (std::string& word : words) arguments.push_back(word.data());
  arguments.push_back(nullptr);

  posix_spawn_file_actions_t files;
  posix_spawnattr_t attributes;
  ::posix_spawn_file_actions_init(&files);
  ::posix_spawnattr_init(&attributes);
  ::posix_spawn_file_actions_adddup2(&files, input, STDIN_FILENO);
  ::posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
  ::posix_spawn_file_actions_adddup2(&files, STDOUT_FILENO, STDERR_FILENO);
  ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSID);
  // By its name, which a person sees in a list of processes.
  const std::string program = std::filesystem::read_symlink("/proc/self/exe");
  pid_t child = -1;
  const int error = ::posix_spawn(&child, program.c_str(), &files, &attributes, arguments.data(), environ);
  ::posix_spawnattr_destroy(&attributes);
  ::posix_spawn_file_actions_destroy(&files);
  return error;
}

void takeBackAndReport() {
  std::string text = "settings on trial were not confirmed and are taken back";
  try {
    const zorva::agent::SettingsLock lock(zorva::agent::dataDirectory(), zorva::agent::Access::Read);
    for (const zorva::agent::ApplyResult& result : zorva::agent::endTrial()) {
      if (!result.problem.empty()) text += "; " + printable(result.problem);
    }
  } catch (const std::exception& error) {
    text = std::string("settings on trial could not be taken back: ") + printable(error.what());
  }
  ::openlog("zorvactl", LOG_PID, LOG_DAEMON);
  ::syslog(LOG_WARNING, "%s", text.c_str());
}

/// The line that counts down, where a person sees it.
class Countdown {
 public:
  void show(std::chrono::seconds left) {
    if (!isShown_ || left == shown_) return;
    shown_ = left;
    const std::string line =
        "\rPress Enter within " + std::to_string(left.count()) + " s to keep these settings; Ctrl-C takes them back. ";
    [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
  }
  ~Countdown() {
    if (isShown_) [[maybe_unused]]
      const ssize_t written = ::write(STDERR_FILENO, "\n", 1);
  }

 private:
  bool isShown_ = ::isatty(STDERR_FILENO) == 1;
  std::chrono::seconds shown_{-1};
};

}  // namespace

TrialGuard::TrialGuard(const Globals& globals) {
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) throw cannotGuard(errno);
  const int error = startGuard(globals, ends[0]);
  ::close(ends[0]);
  guarded_ = ends[1];
  if (error == 0) return;
  ::close(guarded_);
  throw cannotGuard(error);
}

TrialGuard::~TrialGuard() { ::close(guarded_); }

Verdict waitForVerdict(std::chrono::seconds longest) {
  constexpr std::chrono::milliseconds kBetweenLooks{200};
  const Clock::time_point end = Clock::now() + longest;
  Countdown countdown;
  int input = STDIN_FILENO;
  while (Clock::now() < end) {
    countdown.show(std::chrono::ceil<std::chrono::seconds>(end - Clock::now()));
    if (canRead(input, kBetweenLooks)) {
      const std::optional<bool> line = readLine(input);
      if (line.value_or(false)) {
        zorva::agent::confirmTrial();
        return Verdict::Confirmed;
      }
      if (!line) input = -1;
    }
    if (!zorva::agent::pendingTrial()) return Verdict::EndedElsewhere;
  }
  return Verdict::TimeIsUp;
}

void guardTrial(const Globals& globals) {
  // What ends the guarded process by the terminal must not end the guard.
  for (const int signal : {SIGHUP, SIGINT, SIGTERM, SIGPIPE}) std::signal(signal, SIG_IGN);
  const Session session(globals);
  // The guarded process takes the trial back itself when the time is over, and says so; it gets a little more time.
  constexpr std::chrono::seconds kGrace{5};
  for (;;) {
    const auto end = zorva::agent::pendingTrial();
    const bool isOver = end && std::chrono::system_clock::now() > *end + kGrace;
    if (isOver) break;
    if (canRead(STDIN_FILENO, std::chrono::milliseconds(500)) && !readLine(STDIN_FILENO)) break;
  }
  if (zorva::agent::pendingTrial()) takeBackAndReport();
}

}  // namespace zorva::cli
