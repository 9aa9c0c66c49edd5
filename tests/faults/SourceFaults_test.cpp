// Each call with which the agent reads a host fails: a live host, or a document. What could not be read for a temporary
// reason is there at the next look.

#include <gmock/gmock.h>

#include <algorithm>
#include <fstream>
#include <functional>
#include <iostream>

#include "FaultTest.h"
#include "FileCalls.h"
#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/sources/FileSource.h"
#include "agent/sources/HostSource.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace ZV::Test {
namespace {

using zorva::agent::testing::TemporaryDirectory;

class SourceFaults : public ::testing::Test {
 protected:
  SourceFaults() {
    zorva::agent::reset();
    directory_.write("etc/resolv.conf", "nameserver 127.0.0.53\nsearch example.org\n");
    directory_.write("run/systemd/resolve/resolv.conf", "nameserver 192.0.2.53\n");
    directory_.write("etc/hosts", "127.0.0.1 localhost\n");
    directory_.write("sys/class/dmi/id/product_name", "Product\n");
  }
  ~SourceFaults() override { zorva::agent::reset(); }

  // Reads the tree from a new source with each call failing in turn, and then again without failures.
  void failEachCall(const std::function<std::shared_ptr<zorva::agent::TreeSource>()>& makeSource) {
    const auto read = [&] { return zorva::agent::treeToJson(*zorva::agent::currentTree()); };
    const auto start = [&] {
      zorva::agent::reset();
      zorva::agent::Config config;
      config.dataDir = directory_.path();
      config.logTarget = "off";
      zorva::agent::setConfig(config);
      zorva::agent::setTreeSource(makeSource());
    };
    start();
    const std::string usual = read();
    std::size_t tried = 0;
    for (const FileFault fault : {FileFault::Refused, FileFault::HalfDone}) {
      for (std::size_t n = 1;; ++n, ++tried) {
        start();
        FileCall failed{};
        {
          const FailingFiles failing(n, fault);
          try {
            read();
          } catch (const std::runtime_error&) {  // a document that cannot be read is no tree
          }
          if (!failing.wasReached()) break;
          failed = failing.failed();
        }
        EXPECT_EQ(usual, read()) << "after call " << n << ", " << nameOf(failed) << ", " << nameOf(fault);
      }
    }
    countFaults("source", tried);
    std::cout << tried << " faults\n";
    EXPECT_GE(tried, 10U);
  }

  const TemporaryDirectory directory_;
};

TEST_F(SourceFaults, TheHostIsReadAgain) {
  for (const int comparisons : {zorva::agent::FileWatch::kComparisons, 0}) {
    SCOPED_TRACE(comparisons);
    failEachCall([&] {
      return std::make_shared<zorva::agent::HostSource>(zorva::agent::HostSourceOptions{
          .includeLoopback = true, .root = directory_ / "", .comparisons = comparisons});
    });
  }
}

TEST_F(SourceFaults, ADocumentIsReadAgain) {
  const std::string path = directory_.write("tree.json", R"({ "system_name": "host1", "nodes": [] })");
  failEachCall([&] { return std::make_shared<zorva::agent::FileSource>(path); });
}

TEST_F(SourceFaults, ALogThatCannotBeWrittenStopsNothing) {
  zorva::agent::Config config;
  config.dataDir = directory_.path();
  config.logTarget = directory_ / "agent.log";
  config.logLevel = 0;
  std::size_t tried = 0;
  for (const FileFault fault : kAllFileFaults) {
    for (std::size_t n = 1;; ++n, ++tried) {
      zorva::agent::reset();
      zorva::agent::setConfig(config);
      zorva::agent::setTreeSource(
          std::make_shared<zorva::agent::testing::FixedSource>(World().host().nic("eth0").tree()));
      const FailingFiles failing(n, fault);
      RecordingBroker broker;
      const Outcome outcome = requestsOf(allProviders().front()).front().run(broker);
      EXPECT_EQ(CMPI_RC_OK, outcome.rc);
      EXPECT_EQ(1U, outcome.paths().size());
      if (!failing.wasReached()) break;
    }
  }
  countFaults("log", tried);
  std::cout << tried << " faults\n";
  EXPECT_GE(tried, 30U);
}

}  // namespace
}  // namespace ZV::Test
