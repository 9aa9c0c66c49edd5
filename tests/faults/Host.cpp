#include "Host.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "agent/Agent.h"
#include "agent/files/FileWatch.h"
#include "tests/support/ProfileObjects.h"

namespace ZV::Test {
namespace {

constexpr int kLooksUntilSettled = zorva::agent::FileWatch::kComparisons + 2;

const char* const kFileOfHost =
    "# written by a person\n"
    "BOOTPROTO=dhcp\n"
    "HOSTNAME=filehost\n"
    "DOMAINNAME=file.example.org\n"
    "CONFIG_NAME=file configuration\n"
    "DNSSERVERS=192.0.2.7 192.0.2.8 \n"
    "DNSSUFFIXES=file.example.org \n";
const char* const kFileOfServiceProcessor = "DOMAINNAME=bmc.example.org\nDNSSERVERS=\n";
const char* const kSetValuesFile = "overlay.json";
const char* const kSetValues = "{ \"/system/eth1-1/ip\": { \"domain_name\": \"set.example.org\" } }\n";

void write(const std::string& path, const std::string& content) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out << content;
  if (!out.flush()) throw std::runtime_error("cannot write " + path);
}

// Files in memory, if the system has a place for them, are written and removed many times faster.
[[maybe_unused]] const bool kUsesMemory = [] {
  return ::access("/dev/shm", W_OK) == 0 && ::setenv("TMPDIR", "/dev/shm", 0) == 0;
}();

}  // namespace

const char* nameOf(Tree tree) {
  static constexpr const char* kNames[] = {"Empty", "OneInterface", "ThreeInterfaces"};
  return kNames[static_cast<std::size_t>(tree)];
}

Host::Host(Tree tree) {
  world_.host("host1");
  if (tree != Tree::Empty) world_.nic("eth0", usualNic());
  if (tree == Tree::ThreeInterfaces) {
    world_.nic("eth1", {.suffixes = {"a.example.org", "b.example.org"}, .servers = {"2001:db8::53", "192.0.2.53"}});
    world_.bmc().nic("bmc0", {.hostName = "bmc", .domain = "example.org", .servers = {"192.0.2.99"}, .state = 16});
    world_.file("eth0", kFileOfHost).file("bmc0", kFileOfServiceProcessor);
    write(world_.dataDir() + kSetValuesFile, kSetValues);
  }
  world_.install();
  for (int looks = 0; looks < kLooksUntilSettled; ++looks) zorva::agent::currentTree();
  filesAtFirst_ = files();
}

void Host::serveOthers(RecordingBroker& broker) const {
  broker.serve(kSystemClass, objectsOf({systemPath("host1"), systemPath("bmc")}));
  broker.serve(kIpEndpointClass, objectsOf({ipEndpointPath("eth0"), ipEndpointPath("eth1"), ipEndpointPath("wlan0")}));
  broker.serve(kIpAssignmentClass,
               objectsOf({ipAssignmentPath("Computer%eth0%ipv4"), ipAssignmentPath("Computer%eth1%ipv4")}));
}

std::map<std::string, std::string> Host::files() const {
  std::map<std::string, std::string> all;
  for (const auto& entry : std::filesystem::directory_iterator(world_.dataDir())) {
    const std::string name = entry.path().filename();
    if (name == "overlay.lock") continue;
    std::ifstream in(entry.path(), std::ios::binary);
    all[name].assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  }
  return all;
}

void Host::touch() const {
  const auto set = filesAtFirst_.find(kSetValuesFile);
  if (set != filesAtFirst_.end()) write(world_.dataDir() + kSetValuesFile, set->second);
}

void Host::restore() {
  const auto now = files();
  for (const auto& [name, content] : now) {
    if (!filesAtFirst_.contains(name)) std::filesystem::remove(world_.dataDir() + name);
  }
  for (const auto& [name, content] : filesAtFirst_) {
    const auto found = now.find(name);
    if (found == now.end() || found->second != content) write(world_.dataDir() + name, content);
  }
}

}  // namespace ZV::Test
