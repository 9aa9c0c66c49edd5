#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace zorva::cli {

/// A line on standard error that says what a long command is doing: on a terminal alone, from half a second on, gone
/// again at the end. One at a time.
class Progress {
 public:
  Progress();
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  /// What is being done from now on: "counting ZORVA_DNSSettingData".
  void step(std::string what);

  /// Takes the line away until the next step, if one is shown, so that something else can be written.
  static void makeRoom();

 private:
  void run();
  void show();
  void clear();

  std::mutex mutex_;
  std::condition_variable ends_;
  std::string what_;
  std::string shown_;  // empty: no line is there
  bool isOver_ = false;
  std::thread thread_;  // none where standard error is no terminal
};

}  // namespace zorva::cli
