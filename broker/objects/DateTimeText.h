#pragma once

// CIM's date-times as text (DSP0004 5.2.4): a point in time is yyyymmddhhmmss.mmmmmmsutc (utc in minutes, s its sign),
// an interval ddddddddhhmmss.mmmmmm:000, 25 characters each. Unknown fields are asterisks and count as zero (as one in
// month and day). These functions keep no state.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace zorva::broker {

struct DateTimeValue {
  std::uint64_t microseconds = 0;  ///< since 1970-01-01T00:00:00Z, or of the interval
  bool interval = false;
};

/// Nothing if `text` is no date-time. Points before 1970 are refused: CMPI has no number for them.
std::optional<DateTimeValue> parseDateTime(std::string_view text);

/// The 25 characters, points in time in UTC. Nothing for a time after the year 9999, or for an interval of 10^8 days or
/// more.
std::optional<std::string> dateTimeText(const DateTimeValue& value);

}  // namespace zorva::broker
