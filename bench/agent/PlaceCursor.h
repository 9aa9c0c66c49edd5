#pragma once

// What every read of the tree begins with, for the benchmarks of the agent.

#include <benchmark/benchmark.h>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/interface/Instrumentation.h"

inline void placeCursors(benchmark::State& state) {
  zorva::agent::setConfig(zorva::agent::Config());
  for (auto _ : state) {
    ZV::Instrumentation cursor;
    cursor.selectNode(ZV::NodeLexicon::NODE_NETWORK_IP_CONFIG);
    benchmark::DoNotOptimize(cursor);
  }
  zorva::agent::reset();
}
