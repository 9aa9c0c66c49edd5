#pragma once

// Times as texts.

#include <chrono>
#include <cstdio>
#include <ctime>
#include <string>

namespace zorva::util {

/// The time in UTC with milliseconds, as RFC 3339 writes it: "2026-11-22T12:00:00.123Z".
inline std::string utcText(std::chrono::system_clock::time_point time) {
  const auto sinceEpoch = std::chrono::duration_cast<std::chrono::milliseconds>(time.time_since_epoch());
  const std::time_t seconds = sinceEpoch.count() / 1000;
  std::tm parts{};
  ::gmtime_r(&seconds, &parts);
  char text[64];
  const std::size_t length = std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &parts);
  std::snprintf(text + length, sizeof text - length, ".%03dZ", static_cast<int>(sinceEpoch.count() % 1000));
  return text;
}

}  // namespace zorva::util
