#include "agent/testing/PrivateHost.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <thread>

#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/Program.h"
#include "agent/testing/TemporaryDirectory.h"
#include "util/FileDescriptor.h"

namespace zorva::agent::testing {
namespace {

namespace fs = std::filesystem;
using std::chrono::milliseconds;

constexpr const char* kBusSocket = "/run/dbus/system_bus_socket";

void check(bool good, const std::string& what) {
  if (!good) throw std::runtime_error(what + ": " + std::strerror(errno));
}

void mountAt(const char* type, const std::string& target, unsigned long flags = 0, const std::string& options = {}) {
  check(::mount(type, target.c_str(), type, flags, options.c_str()) == 0, "cannot mount " + target);
}

// Makes the private root under a directory and enters it. The packages' files lie over this machine's: an overlay takes
// no layer that is part of another one, so they are copied.
void enterPrivateRoot(const std::string& base, const std::string& packages) {
  check(::mount("", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0, "cannot part the mounts");
  mountAt("tmpfs", base);
  for (const char* name : {"packages", "upper", "work", "root"}) fs::create_directory(base + name);
  if (!packages.empty()) {
    fs::copy(packages, base + "packages", fs::copy_options::recursive | fs::copy_options::copy_symlinks);
  }
  const std::string root = base + "root";
  mountAt("overlay", root, 0, "lowerdir=" + base + "packages:/,upperdir=" + base + "upper,workdir=" + base + "work");
  mountAt("proc", root + "/proc");
  mountAt("sysfs", root + "/sys", MS_RDONLY);  // a writable one means to NetworkManager that udev is there
  mountAt("tmpfs", root + "/run");
  check(::mount("/dev", (root + "/dev").c_str(), nullptr, MS_BIND | MS_REC, nullptr) == 0, "cannot mount /dev");
  // The build folder may be a mount of its own, which an overlay leaves out.
  for (const std::string folder : {ZORVAGENT_SOURCE_DIR, ZORVAGENT_BUILD_DIR}) {
    if (fs::exists(root + folder)) continue;
    fs::create_directories(root + folder);
    check(::mount(folder.c_str(), (root + folder).c_str(), nullptr, MS_BIND | MS_REC, nullptr) == 0, "cannot bind");
  }
  check(::chroot(root.c_str()) == 0 && ::chdir("/") == 0, "cannot enter the root");
  for (const char* path : {"/run/systemd/system", "/run/dbus", "/run/log", "/run/lock"}) fs::create_directories(path);
}

bool unshareAll() {
  return ::geteuid() == 0 && ::unshare(CLONE_NEWNS | CLONE_NEWNET | CLONE_NEWPID | CLONE_NEWUTS | CLONE_NEWIPC) == 0;
}

// The work as process 1, which takes every process of its namespace along when it ends.
bool runAsFirstProcess(const std::string& packages, const std::function<bool()>& work) {
  const TemporaryDirectory base;
  return succeedsInChild([&] {
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (!unshareAll()) return false;
    return succeedsInChild([&] {
      ::prctl(PR_SET_PDEATHSIG, SIGKILL);
      enterPrivateRoot(base.path(), packages);
      Interfaces().setUp("lo", true);
      return work();
    });
  });
}

std::string fetchDaemons() {
  const std::string folder = std::string(ZORVAGENT_BUILD_DIR) + "/daemons";
  const std::string script = std::string(ZORVAGENT_SOURCE_DIR) + "/agent/testing/fetch_daemons.sh";
  if (std::system(("'" + script + "' '" + folder + "'").c_str()) != 0) {
    throw std::runtime_error("the daemons' packages cannot be fetched");
  }
  return folder + "/root";
}

// The configuration that each daemon starts with, other than what its package brings.
void writeConfiguration() {
  writeFile("/run/dbus/bus.conf",
            "<busconfig><type>system</type><listen>unix:path=" + std::string(kBusSocket) +
                "</listen><auth>EXTERNAL</auth><policy context=\"default\"><allow user=\"*\"/><allow own=\"*\"/>"
                "<allow send_destination=\"*\"/><allow receive_sender=\"*\"/><allow send_type=\"method_call\"/>"
                "<allow receive_type=\"method_call\"/></policy></busconfig>\n");
  for (const char* folder : {"/etc/NetworkManager", "/var/lib/NetworkManager", "/etc/systemd/network"}) {
    fs::remove_all(folder);
    fs::create_directories(folder);
  }
  writeFile("/etc/NetworkManager/NetworkManager.conf",
            "[main]\nplugins=keyfile\nauth-polkit=false\nno-auto-default=*\ndhcp=internal\n");
  writeFile("/etc/systemd/resolved.conf", "[Resolve]\nFallbackDNS=\n");
  // DHCP clients make their identifier of it, and a new machine has none before systemd ran on it.
  writeFile("/etc/machine-id", "0123456789abcdef0123456789abcdef\n");
  for (const char* folder : {"links", "leases", "lldp"}) {
    fs::create_directories(std::string("/run/systemd/netif/") + folder);
  }
}

// The users that the daemons become, which their packages would have made.
void addUsers() {
  const std::string known = '\n' + contentsOf("/etc/passwd");
  int number = 990;
  for (const std::string user : {"systemd-resolve", "systemd-network", "messagebus"}) {
    if (known.find('\n' + user + ':') != std::string::npos) continue;
    const std::string numbers = std::to_string(number++);
    std::ofstream("/etc/passwd", std::ios::app) << user + ":x:" + numbers + ':' + numbers + "::/:/usr/sbin/nologin\n";
    std::ofstream("/etc/group", std::ios::app) << user + ":x:" + numbers + ":\n";
  }
  outputOf("chown -R systemd-network:systemd-network /run/systemd/netif");
}

struct Daemon {
  const char* name;
  std::vector<const char*> command;
  const char* ready;  // a shell command that succeeds when the daemon can be asked
};

#define ZORVAGENT_HAS_NAME "busctl call org.freedesktop.DBus /org/freedesktop/DBus org.freedesktop.DBus GetNameOwner s "

const Daemon& daemonOf(const std::string& name) {
  static const std::array<Daemon, 4> kDaemons{
      Daemon{"dbus-daemon",
             {"/usr/bin/dbus-daemon", "--config-file=/run/dbus/bus.conf", "--nofork", "--nopidfile"},
             "busctl list"},
      Daemon{"systemd-resolved", {"/usr/lib/systemd/systemd-resolved"}, ZORVAGENT_HAS_NAME "org.freedesktop.resolve1"},
      Daemon{"systemd-networkd", {"/usr/lib/systemd/systemd-networkd"}, ZORVAGENT_HAS_NAME "org.freedesktop.network1"},
      Daemon{"NetworkManager",
             {"/usr/sbin/NetworkManager", "--no-daemon"},
             "nmcli --terse --fields STARTUP general | grep started"}};
  for (const Daemon& daemon : kDaemons) {
    if (daemon.name == name) return daemon;
  }
  throw std::invalid_argument("no such daemon: " + name);
}

std::string logOf(const std::string& name) { return "/run/log/" + name; }

}  // namespace

bool canMakePrivateHosts() {
  static const bool can = runAsFirstProcess({}, [] { return true; });
  return can;
}

bool runOnPrivateHost(const std::function<bool()>& work) { return runAsFirstProcess({}, work); }

bool runOnHostWithDaemons(const std::function<bool()>& work) {
  return runAsFirstProcess(fetchDaemons(), [&work] {
    writeConfiguration();
    addUsers();
    return work();
  });
}

std::string outputOf(const std::string& command) {
  std::FILE* pipe = ::popen(("exec 2>&1; " + command).c_str(), "r");
  check(pipe != nullptr, command);
  std::string output;
  std::array<char, 4096> buffer;
  for (std::size_t got = 0; (got = std::fread(buffer.data(), 1, buffer.size(), pipe)) > 0;) {
    output.append(buffer.data(), got);
  }
  if (::pclose(pipe) != 0) throw std::runtime_error(command + " failed: " + output);
  return output;
}

void writeFile(const std::string& path, const std::string& text) {
  fs::create_directories(fs::path(path).parent_path());
  fs::remove(path);
  std::ofstream(path, std::ios::binary) << text;
  fs::permissions(path,
                  fs::perms::owner_read | fs::perms::owner_write | fs::perms::group_read | fs::perms::others_read);
}

Daemons::Daemons() { start("dbus-daemon"); }

Daemons::~Daemons() {
  for (const auto& [name, process] : processes_) ::kill(process, SIGKILL);
  for (const auto& [name, process] : processes_) ::waitpid(process, nullptr, 0);
}

void Daemons::start(const std::string& name) {
  const Daemon& daemon = daemonOf(name);
  if (name == "dbus-daemon") fs::remove(kBusSocket);
  const Program program({daemon.command.begin(), daemon.command.end()});
  const util::FileDescriptor log(::open(logOf(name).c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644));
  const pid_t process = ::fork();
  check(process >= 0, name);
  if (process == 0) program.exec(log.get(), log.get());
  processes_[name] = process;
  constexpr int kTurns = 500;
  for (int turn = 0; turn < kTurns; ++turn) {
    if (std::system(("{ " + std::string(daemon.ready) + "; } >/dev/null 2>&1").c_str()) == 0) return;
    if (::waitpid(process, nullptr, WNOHANG) == process) break;
    std::this_thread::sleep_for(milliseconds(20));
  }
  throw std::runtime_error(name + " does not start: " + contentsOf(logOf(name)));
}

void Daemons::send(const std::string& name, int signal) {
  check(::kill(processes_.at(name), signal) == 0, "no signal reaches " + name);
}

void Daemons::stop(const std::string& name) {
  send(name, SIGTERM);
  ::waitpid(processes_.at(name), nullptr, 0);
  processes_.erase(name);
}

void Daemons::freeze(const std::string& name) {
  send(name, SIGSTOP);
  ::waitpid(processes_.at(name), nullptr, WUNTRACED);
}

void Daemons::thaw(const std::string& name) { send(name, SIGCONT); }

}  // namespace zorva::agent::testing
