// Eight clients at once request everything that the twelve providers do, through the broker and the loaded shared
// libraries, while the host changes: interfaces come and go, files are rewritten and replaced.
//
// ZORVA_SOAK_SECONDS sets the duration; the default is one second.

#include <gmock/gmock.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <thread>

#include "Load.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/TemporaryDirectory.h"
#include "schema/Schema.h"
#include "util/NotCopied.h"

namespace ZV::Test {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using std::chrono::steady_clock;
using zorva::agent::testing::Interfaces;
using zorva::agent::testing::TemporaryDirectory;

constexpr unsigned int kClients = 8;
constexpr seconds kLongestReply{30};  // under a sanitizer on a busy machine; a longer request hangs
constexpr const char* kInside = "ZORVA_SOAK_INSIDE";

seconds duration() {
  const char* asked = std::getenv("ZORVA_SOAK_SECONDS");
  const int count = asked == nullptr ? 1 : std::atoi(asked);
  return seconds(std::clamp(count, 1, 3600));
}

// A host that changes, with its data directory and the agent's configuration.
class ChangingHost : zorva::util::NotCopied {
 public:
  explicit ChangingHost(const std::string& source) {
    directory_.write("agent.toml", "[agent]\ndata_dir = \"" + directory_.path() + "\"\n[tree]\nsource = \"" + source +
                                       "\"\nfile = \"" + directory_ / "tree.json" + "\"\n[log]\ntarget = \"off\"\n");
    ::setenv("ZORVAGENT_CONFIG", (directory_ / "agent.toml").c_str(), 1);
  }
  virtual ~ChangingHost() { ::unsetenv("ZORVAGENT_CONFIG"); }

  // Changes the interfaces; called repeatedly by one thread.
  virtual void changeInterfaces(unsigned int step) = 0;
  // Leaves a fixed set of interfaces and returns their names.
  virtual std::set<std::string> leaveFixedInterfaces() = 0;

  // Rewrites, replaces, removes and makes interface files; called repeatedly by another thread.
  void changeFiles(unsigned int step) const {
    const std::string path = directory_ / ("ifcfg-nic" + std::to_string(step % 3));
    const std::string text = std::string("BOOTPROTO=dhcp\nHOSTNAME=") + kWrittenNames[step % 3] +
                             "\nDOMAINNAME=" + kWrittenNames[step / 3 % 3] +
                             "\nCONFIG_NAME=configuration\nDNSSERVERS=192.0.2.7 \nDNSSUFFIXES=alpha.example.org \n";
    switch (step % 5) {
      case 0:
        std::filesystem::remove(path);
        break;
      case 1:
      case 2:
        std::ofstream(path, std::ios::trunc) << text;
        break;
      default:
        std::ofstream(path + ".new", std::ios::trunc) << text;
        std::filesystem::rename(path + ".new", path);
    }
  }

 protected:
  const TemporaryDirectory directory_;
};

// Interfaces from a document, which is replaced.
class DocumentHost : public ChangingHost {
 public:
  DocumentHost() : ChangingHost("file") { write(1); }

  void changeInterfaces(unsigned int step) override { write(step % 4); }
  std::set<std::string> leaveFixedInterfaces() override {
    write(2);
    return {"nic0", "nic1"};
  }

 private:
  void write(unsigned int count) const {
    std::string ports;
    for (unsigned int i = 0; i < count; ++i) {
      const std::string name = "nic" + std::to_string(i);
      ports += std::string(i == 0 ? "" : ",") + R"({"type": "Port", "name": ")" + name +
               R"(", "description": "", "children": [{"type": "NetworkIPConfig", "name": "ip", "description": "",
                  "properties": {"name": ")" +
               name + R"(", "host_name": "source", "domain_name": "source.example.org", "enabled_state": 1,
                  "dns_suffixes": ["source.example.org"], "dns_server_addresses": ["192.0.2.53"],
                  "addresses": [{"address": "192.0.2.10", "prefix_length": 24, "origin": "static"}]}}]})";
    }
    directory_.write("tree.json.new", R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system",
        "description": "Computer", "children": [)" +
                                          ports + "]}]}");
    std::filesystem::rename(directory_ / "tree.json.new", directory_ / "tree.json");
  }
};

// Interfaces of the kernel, in this process's own network.
class NetworkHost : public ChangingHost {
 public:
  NetworkHost() : ChangingHost("host") { interfaces_.addBridge("nic0"); }

  void changeInterfaces(unsigned int step) override {
    const std::string name = "nic" + std::to_string(1 + step / 6 % 2);
    switch (step % 6) {
      case 0:
        return interfaces_.addBridge(name);
      case 1:
        return interfaces_.setUp(name, true);
      case 2:
        return interfaces_.addAddress(name, "192.0.2." + std::to_string(1 + step % 200), 24);
      case 3:
        return interfaces_.setUp(name, false);
      case 4:
        return interfaces_.rename(name, "moved");
      default:
        return interfaces_.remove("moved");
    }
  }
  std::set<std::string> leaveFixedInterfaces() override {
    for (const char* name : {"nic1", "nic2", "moved"}) {
      try {
        interfaces_.remove(name);
      } catch (const std::runtime_error&) {  // it does not exist
      }
    }
    return {"nic0"};
  }

 private:
  Interfaces interfaces_;
};

std::set<std::string> textsOfEndpoints(zorva::broker::Broker& broker, std::initializer_list<const char*> properties) {
  std::set<std::string> texts;
  const auto status = broker.enumerateInstances("root/cimv2", "ZORVA_DNSProtocolEndPoint", {}, [&](const auto& found) {
    for (const char* name : properties) {
      const auto* value = found.property(name);
      if (value != nullptr && !value->isNull) texts.insert(std::string(value->asText()));
    }
    return true;
  });
  EXPECT_TRUE(status.ok()) << status.message;
  return texts;
}

// Calls the step repeatedly until the time is over.
template <typename Step>
std::thread repeat(const std::atomic<bool>& isOver, milliseconds pause, Step step) {
  return std::thread([&isOver, pause, step] {
    try {
      for (unsigned int i = 0; !isOver; ++i) {
        step(i);
        if (pause.count() != 0) std::this_thread::sleep_for(pause);
      }
    } catch (const std::exception& error) {
      ADD_FAILURE() << error.what();
    }
  });
}

void work(Load& load, ChangingHost& host) {
  std::atomic<bool> isOver = false;
  std::atomic<std::chrono::nanoseconds> longest = {};
  std::vector<std::thread> threads;
  threads.push_back(repeat(isOver, milliseconds(2), [&](unsigned int step) { host.changeInterfaces(step); }));
  threads.push_back(repeat(isOver, milliseconds(1), [&](unsigned int step) { host.changeFiles(step); }));
  for (unsigned int seed = 1; seed <= kClients; ++seed) {
    const auto client = std::make_shared<Client>(load, seed);
    threads.push_back(repeat(isOver, milliseconds(0), [&, client](unsigned int) {
      const auto start = steady_clock::now();
      client->request();
      const std::chrono::nanoseconds took = steady_clock::now() - start;
      if (took > longest.load()) longest = took;
    }));
  }
  std::this_thread::sleep_for(duration());
  isOver = true;
  for (std::thread& thread : threads) thread.join();
  EXPECT_LT(longest.load(), kLongestReply);
  std::cout << load.reads << " reads, " << load.traversals << " traversals, " << load.changes << " changes, "
            << load.methods << " methods, " << load.objects << " objects in " << duration().count() << " s; longest "
            << longest.load() / milliseconds(1) << " ms\n";
}

void soak(ChangingHost& host) {
  zorva::broker::BrokerOptions options;
  options.providerDirectory = ZORVA_LIB_DIR;
  zorva::broker::Broker broker(zorva::schema::loadBuiltInClasses(), options);
  Load load(broker, textsOfEndpoints(broker, {"DomainName", "Hostname"}));
  work(load, host);
  EXPECT_EQ(0U, load.problems);
  for (const auto* count : {&load.reads, &load.traversals, &load.changes, &load.methods, &load.objects}) {
    EXPECT_GT(*count, 0U);
  }
  const std::set<std::string> left = host.leaveFixedInterfaces();
  EXPECT_EQ(left, textsOfEndpoints(broker, {"Name"})) << "what is seen afterwards is not what is there";
}

TEST(Soak, ClientsWhileADocumentChanges) {
  DocumentHost host;
  soak(host);
}

// Runs only this test, in a process with its own network.
bool succeedsInNewNetwork(const char* test) {
  const pid_t child = ::fork();
  if (child == 0) {
    if (!zorva::agent::testing::enterNewNetwork()) ::_exit(1);
    ::setenv(kInside, "1", 1);
    const std::string filter = std::string("--gtest_filter=") + test;
    ::execl("/proc/self/exe", "soak_test", filter.c_str(), nullptr);
    ::_exit(1);
  }
  int status = 0;
  return child > 0 && ::waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

TEST(Soak, ClientsWhileInterfacesComeAndGo) {
  if (std::getenv(kInside) == nullptr) {
    ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
    EXPECT_TRUE(succeedsInNewNetwork("Soak.ClientsWhileInterfacesComeAndGo"));
    return;
  }
  NetworkHost host;
  soak(host);
}

}  // namespace
}  // namespace ZV::Test
