// The cost of a line that is not logged: its text is made twice and then dropped.

#include <benchmark/benchmark.h>

#include <array>
#include <cstdio>
#include <string>

#include "agent/Seams.h"
#include "trace/Trace.h"

namespace {

const std::string category = "Zorvagent.DNSClientProvider";
constexpr const char* kText = "getAllDNSClientCMPIObjPaths Failed";
constexpr std::size_t kLine = 512;

// All lines are dropped, as if log and trace were off.
void dropAllLines() {
  zorva::agent::Config config;
  config.logTarget = "off";
  config.traceTarget = "off";
  zorva::agent::setConfig(config);
  ZV::logMessage(category, ZV_HERE, ZV::LOG_LEVEL_FLOW, kText);
}

void LogPair(benchmark::State& state) {
  dropAllLines();
  for (auto _ : state) ZV::logMessage(category, ZV_HERE, ZV::LOG_LEVEL_DETAIL, kText);
  zorva::agent::reset();
}
BENCHMARK(LogPair);

void BoundedPrint(benchmark::State& state) {
  std::array<char, kLine> line;
  for (auto _ : state) {
    std::snprintf(line.data(), line.size(), "MESSAGE [File: %s, Line: %d]: %s", __FILE__, __LINE__, kText);
    benchmark::DoNotOptimize(line);
  }
}
BENCHMARK(BoundedPrint);

// Six addresses such as a provider has, some on the heap and some on the stack.
struct Arguments {
  int onStack[3] = {};
  std::string onHeap[3];
};

void EntryLineHalf(benchmark::State& state) {
  dropAllLines();
  Arguments a;
  while (state.KeepRunningBatch(2)) {
    ZV::logEntry(category, ZV_HERE, " broker=", &a.onStack[0], " ctx=", &a.onStack[1], " rslt=", &a.onStack[2],
                 " ref=", &a.onHeap[0], " properties=", &a.onHeap[1], " status=", &a.onHeap[2]);
  }
  zorva::agent::reset();
}
BENCHMARK(EntryLineHalf);

void BoundedPrintOfEntry(benchmark::State& state) {
  Arguments a;
  std::array<char, kLine> line;
  const auto address = [](const auto& object) { return static_cast<const void*>(&object); };
  for (auto _ : state) {
    std::snprintf(line.data(), line.size(),
                  "ENTERING: %s() in %s [Line: %d],Parameters List:  broker=%p ctx=%p rslt=%p ref=%p properties=%p "
                  "status=%p",
                  static_cast<const char*>(__func__), __FILE__, __LINE__, address(a.onStack[0]), address(a.onStack[1]),
                  address(a.onStack[2]), address(a.onHeap[0]), address(a.onHeap[1]), address(a.onHeap[2]));
    benchmark::DoNotOptimize(line);
  }
}
BENCHMARK(BoundedPrintOfEntry);

}  // namespace
