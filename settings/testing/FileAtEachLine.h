#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/Seams.h"
#include "tests/support/World.h"
#include "util/NotCopied.h"

namespace ZV::Test {

/// The contents of a file at each log line.
class FileAtEachLine : private zorva::agent::LogSink, zorva::util::NotCopied {
 public:
  FileAtEachLine(const World& world, std::string interface) : world_(world), interface_(std::move(interface)) {
    zorva::agent::setLogSink(this);
  }
  ~FileAtEachLine() override { zorva::agent::setLogSink(nullptr); }

  std::vector<std::optional<std::string>> contents;

 private:
  void record(const zorva::agent::LogCall& call) override {
    if (call.stream == zorva::agent::LogStream::Log) contents.push_back(world_.fileContent(interface_));
  }

  const World& world_;
  const std::string interface_;
};

}  // namespace ZV::Test
