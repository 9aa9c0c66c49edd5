#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

#include "util/NotCopied.h"

namespace zorva::cli {

/// A line on standard error that says what a long command is doing: only on a terminal, only after half a second, and
/// erased at the end. One at a time; none on a thread whose output is captured.
class Progress : util::NotCopied {
 public:
  Progress();
  ~Progress();

  /// The current step: "counting ZORVA_DNSSettingData".
  void step(std::string what);

  /// Erases the line, if one is shown, until the next step, so that something else can be written.
  static void makeRoom();

  /// From now on no line is shown.
  static void neverShow();

 private:
  void run();
  void show();
  void clear();

  std::mutex mutex_;
  std::condition_variable ends_;
  std::string what_;
  std::string shown_;  ///< empty: no line is shown
  bool isOver_ = false;
  std::thread thread_;  ///< none if standard error is no terminal
};

}  // namespace zorva::cli
