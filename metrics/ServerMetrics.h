#pragma once

// What Prometheus learns about the server itself. Thread-safe; counting takes one short lock.

#include <array>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <string_view>
#include <utility>

#include "metrics/Exposition.h"

namespace zorva::metrics {

/// What a request was for.
enum class Target : std::uint8_t { Cim, Page, Stream };

class ServerMetrics {
 public:
  /// A request that was answered, with its HTTP status. The time of a stream does not count.
  void requestEnded(Target target, int status, std::chrono::microseconds time);

  /// An operation that was carried out, with its CIM status. An operation that DSP0200 does not know counts as a
  /// method; so clients cannot make further series.
  void operationEnded(std::string_view operation, int status);

  /// A provider did not return in time.
  void providerIsLate();

  /// Writes the counters. Series appear when they are first counted, apart from those that alerts need.
  void write(Exposition& out) const;

 private:
  static constexpr std::array kBounds{0.0005, 0.001, 0.0025, 0.005, 0.01, 0.025, 0.05, 0.1,
                                      0.25,   0.5,   1.0,    2.5,   5.0,  10.0,  60.0};

  struct Histogram {
    std::array<std::uint64_t, kBounds.size()> counts{};  ///< of each bucket alone
    std::uint64_t total = 0;
    double seconds = 0;
  };

  void writeRequests(Exposition& out) const;
  void writeTimes(Exposition& out) const;
  void writeOperations(Exposition& out) const;

  mutable std::mutex mutex_;
  std::map<std::pair<Target, int>, std::uint64_t> requests_;
  std::array<Histogram, 2> times_;  ///< of Cim and of Page
  std::map<std::pair<std::size_t, int>, std::uint64_t> operations_;
  std::uint64_t refusals_ = 0;
  std::uint64_t failures_ = 0;
  std::uint64_t late_ = 0;
};

/// The process: its start, memory, processor time, descriptors and version.
void writeProcess(Exposition& out, std::string_view version);

}  // namespace zorva::metrics
