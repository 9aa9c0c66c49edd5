#include "cli/output/Terminal.h"

#include <fcntl.h>
#include <signal.h>
#include <termios.h>
#include <unistd.h>

#include <array>
#include <cerrno>

#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kLongestLine = 1024;
constexpr std::array kSignals{SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGTSTP};

volatile sig_atomic_t caught = 0;

void remember(int signal) { caught = signal; }

/// While it lives, signals only interrupt system calls. They count at its end.
class HeldSignals : util::NotCopied {
 public:
  HeldSignals() {
    caught = 0;
    struct sigaction action {};
    action.sa_handler = remember;
    ::sigemptyset(&action.sa_mask);
    for (std::size_t i = 0; i < kSignals.size(); ++i) ::sigaction(kSignals[i], &action, &before_[i]);
  }
  ~HeldSignals() {
    for (std::size_t i = 0; i < kSignals.size(); ++i) ::sigaction(kSignals[i], &before_[i], nullptr);
    if (caught != 0) ::raise(caught);
  }

 private:
  std::array<struct sigaction, kSignals.size()> before_{};
};

/// While it lives, the terminal does not show what is typed.
class HiddenEcho : util::NotCopied {
 public:
  explicit HiddenEcho(int terminal) : terminal_(terminal) {
    isSet_ = ::tcgetattr(terminal_, &before_) == 0;
    termios hidden = before_;
    hidden.c_lflag &= ~static_cast<tcflag_t>(ECHO);
    if (isSet_) ::tcsetattr(terminal_, TCSAFLUSH, &hidden);
  }
  ~HiddenEcho() {
    if (isSet_) ::tcsetattr(terminal_, TCSAFLUSH, &before_);
  }

 private:
  int terminal_;
  termios before_{};
  bool isSet_ = false;
};

void writeTo(int terminal, const std::string& text) { (void)!::write(terminal, text.data(), text.size()); }

std::optional<std::string> readLine(int terminal) {
  std::string line;
  line.reserve(kLongestLine);  // a secret leaves no copies where it grew
  for (char c = 0; line.size() < kLongestLine;) {
    const ssize_t count = ::read(terminal, &c, 1);
    if (count < 0 && errno == EINTR && caught == 0) continue;
    if (count <= 0) return std::nullopt;
    if (c == '\n') return line;
    line += c;
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::string> askTerminal(const std::string& question, Echo echo) {
  const util::FileDescriptor terminal(::open("/dev/tty", O_RDWR | O_NOCTTY | O_CLOEXEC));
  if (!terminal) return std::nullopt;
  const HeldSignals signals;
  std::optional<HiddenEcho> hidden;
  if (echo == Echo::Hidden) hidden.emplace(terminal.get());
  writeTo(terminal.get(), question);
  std::optional<std::string> line = readLine(terminal.get());
  if (echo == Echo::Hidden) writeTo(terminal.get(), "\n");
  return line;
}

}  // namespace zorva::cli
