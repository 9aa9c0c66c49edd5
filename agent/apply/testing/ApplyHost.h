#pragma once

// A private host with interfaces, whose agent has a data directory of its own.

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>

#include "agent/Agent.h"
#include "agent/Runtime.h"
#include "agent/Seams.h"
#include "agent/apply/Apply.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent::testing {

/// Lets another process do the work and kills it after that time.
template <typename Time, typename Work>
void killAfter(Time time, Work work) {
  const pid_t child = startChild([&work] {
    work();
    return true;
  });
  std::this_thread::sleep_for(time);
  ::kill(child, SIGKILL);
  ::waitpid(child, nullptr, 0);
}

/// Made inside of a private host.
class ApplyHost {
 public:
  ApplyHost() {
    interfaces.addPair("eth0", "far0");
    interfaces.addPair("tun1", "far1");
    for (const char* name : {"eth0", "far0", "tun1", "far1"}) interfaces.setUp(name, true);
    Config config;
    config.dataDir = "/var/lib/zorvagent/";
    std::filesystem::create_directories(config.dataDir);
    setConfig(config);
  }
  ~ApplyHost() { reset(); }
  ApplyHost(const ApplyHost&) = delete;
  ApplyHost& operator=(const ApplyHost&) = delete;

  /// Writes an interface's file of settings.
  static void want(const std::string& interface, const std::string& text) {
    writeFile("/var/lib/zorvagent/ifcfg-" + interface, text);
  }

  /// What the tree shows, "192.0.2.1 192.0.2.2 / lab.example": servers and suffixes.
  static std::string shown(const std::string& interface) {
    const auto tree = currentTree();
    const Node* node = tree->find("/system/" + interface + "/ip");
    if (node == nullptr) return "no such interface";
    return words(node->list(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES)) + "/" +
           words(node->list(ZV::NodeLexicon::PROP_DNS_SUFFIXES));
  }

  static std::string words(const StringList* list) {
    std::string text;
    if (list == nullptr) return text;
    for (const std::string& word : *list) text += word + ' ';
    return text;
  }

  /// The results as lines: "eth0: dns_suffixes a b -> c", "eth0: PROBLEM".
  static std::string linesOf(const std::vector<ApplyResult>& results) {
    std::string lines;
    for (const ApplyResult& result : results) {
      const std::string start = result.interface + ": ";
      if (!result.problem.empty()) lines += start + "PROBLEM " + result.problem + '\n';
      for (const PropertyChange& change : result.changes) {
        lines += start + change.property + ' ' + words(&change.before) + "-> " + words(&change.after) + '\n';
      }
      if (result.problem.empty() && result.changes.empty()) lines += start + "nothing\n";
    }
    return lines;
  }

  static std::string apply(const std::vector<std::string>& names = {}, const ApplyOptions& options = {}) {
    return linesOf(applySettings(names, options));
  }
  static std::string revert(const std::vector<std::string>& names = {}, const ApplyOptions& options = {}) {
    return linesOf(revertSettings(names, options));
  }

  Interfaces interfaces;
};

/// Does the work on a private host with that /etc/resolv.conf and without daemons. True where no expectation fails.
inline bool onPlainHost(const std::string& resolvConf, const std::function<void(ApplyHost&)>& work) {
  return succeedsOnPrivateHost([&] {
    writeFile("/etc/resolv.conf", resolvConf);
    ApplyHost host;
    work(host);
    return true;
  });
}

}  // namespace zorva::agent::testing
