#pragma once

// The agent's own lines of the log.

#include <string>
#include <vector>

#include "agent/log/LogSink.h"
#include "util/NotCopied.h"

namespace zorva::agent::testing {

/// Takes the lines that the agent itself writes while this exists. One at a time.
class LogLines : public LogSink, private util::NotCopied {
 public:
  LogLines() { setLogSink(this); }
  ~LogLines() override { setLogSink(nullptr); }

  void record(const LogCall&) override {}
  void recordOwn(int, const std::string& message) override { lines.push_back(message); }

  std::vector<std::string> lines;
};

}  // namespace zorva::agent::testing
