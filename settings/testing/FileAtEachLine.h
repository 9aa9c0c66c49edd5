#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "World.h"
#include "agent/Seams.h"

namespace ZV::Test {

// What a file holds at each line of the log.
class FileAtEachLine : private zorvagent::LogSink {
 public:
  FileAtEachLine(const World& world, std::string interface) : world_(world), interface_(std::move(interface)) {
    zorvagent::setLogSink(this);
  }
  ~FileAtEachLine() override { zorvagent::setLogSink(nullptr); }
  FileAtEachLine(const FileAtEachLine&) = delete;
  FileAtEachLine& operator=(const FileAtEachLine&) = delete;

  std::vector<std::optional<std::string>> contents;

 private:
  void record(const zorvagent::LogCall& call) override {
    if (call.stream == zorvagent::LogStream::Log) contents.push_back(world_.fileContent(interface_));
  }

  const World& world_;
  const std::string interface_;
};

}  // namespace ZV::Test
