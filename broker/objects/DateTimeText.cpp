#include "broker/objects/DateTimeText.h"

#include <chrono>
#include <cstddef>
#include <cstdio>

namespace zorva::broker {

namespace {

constexpr std::size_t kLength = 25;
constexpr std::uint64_t kSecond = 1000000;
constexpr std::uint64_t kMinute = 60 * kSecond;
constexpr std::uint64_t kDay = std::uint64_t{24} * 60 * kMinute;

bool isDigit(char c) noexcept { return c >= '0' && c <= '9'; }

/// Reads fields from left to right. A field is digits or asterisks; after an asterisk all fields must be asterisks.
class Fields {
 public:
  explicit Fields(std::string_view text) : text_(text) {}

  /// The next `width` characters as a number, `unknown` where they are asterisks.
  std::uint64_t next(std::size_t width, std::uint64_t least, std::uint64_t most, std::uint64_t unknown) {
    const std::string_view field = text_.substr(position_, width);
    position_ += width;
    if (field.find_first_not_of('*') == std::string_view::npos) {
      asterisks_ = true;
      return unknown;
    }
    std::uint64_t number = 0;
    for (const char c : field) {
      if (!isDigit(c)) return fail();
      number = number * 10 + static_cast<std::uint64_t>(c - '0');
    }
    return asterisks_ || number < least || number > most ? fail() : number;
  }

  /// The six digits after the point: asterisks may begin at any of them.
  std::uint64_t nextFraction() {
    const std::string_view field = text_.substr(position_, 6);
    position_ += 6;
    std::uint64_t number = 0;
    for (const char c : field) {
      if (c == '*') {
        asterisks_ = true;
        number *= 10;
      } else if (isDigit(c) && !asterisks_) {
        number = number * 10 + static_cast<std::uint64_t>(c - '0');
      } else {
        return fail();
      }
    }
    return number;
  }

  bool good() const noexcept { return good_; }

 private:
  std::uint64_t fail() noexcept {
    good_ = false;
    return 0;
  }

  std::string_view text_;
  std::size_t position_ = 0;
  bool asterisks_ = false;
  bool good_ = true;
};

std::optional<DateTimeValue> parseInterval(std::string_view text) {
  if (text.substr(21) != ":000") return std::nullopt;
  Fields days(text);
  const std::uint64_t day = days.next(8, 0, 99999999, 0);
  const std::uint64_t hour = days.next(2, 0, 23, 0);
  const std::uint64_t minute = days.next(2, 0, 59, 0);
  const std::uint64_t second = days.next(2, 0, 59, 0);
  Fields fraction(text.substr(15, 6));
  const std::uint64_t micro = fraction.nextFraction();
  if (!days.good() || !fraction.good()) return std::nullopt;
  return DateTimeValue{day * kDay + (hour * 60 + minute) * kMinute + second * kSecond + micro, true};
}

std::optional<DateTimeValue> parsePoint(std::string_view text) {
  if (text[21] != '+' && text[21] != '-') return std::nullopt;
  Fields date(text);
  const std::uint64_t year = date.next(4, 0, 9999, 1970);
  const std::uint64_t month = date.next(2, 1, 12, 1);
  const std::uint64_t day = date.next(2, 1, 31, 1);
  const std::uint64_t hour = date.next(2, 0, 23, 0);
  const std::uint64_t minute = date.next(2, 0, 59, 0);
  const std::uint64_t second = date.next(2, 0, 59, 0);
  Fields fraction(text.substr(15, 6));
  const std::uint64_t micro = fraction.nextFraction();
  Fields zone(text.substr(22));
  const auto offset = static_cast<std::int64_t>(zone.next(3, 0, 999, 0)) * (text[21] == '-' ? -1 : 1);
  const std::chrono::year_month_day calendar(std::chrono::year(static_cast<int>(year)),
                                             std::chrono::month(static_cast<unsigned>(month)),
                                             std::chrono::day(static_cast<unsigned>(day)));
  if (!date.good() || !fraction.good() || !zone.good() || !calendar.ok()) return std::nullopt;
  const std::int64_t days = std::chrono::sys_days(calendar).time_since_epoch().count();
  const std::int64_t minutes = (days * 24 + static_cast<std::int64_t>(hour)) * 60 + static_cast<std::int64_t>(minute);
  // The offset is that of local time: east of Greenwich UTC is earlier.
  if (minutes < offset) return std::nullopt;
  return DateTimeValue{static_cast<std::uint64_t>(minutes - offset) * kMinute + second * kSecond + micro, false};
}

}  // namespace

std::optional<DateTimeValue> parseDateTime(std::string_view text) {
  if (text.size() != kLength || text[14] != '.') return std::nullopt;
  return text[21] == ':' ? parseInterval(text) : parsePoint(text);
}

std::optional<std::string> dateTimeText(const DateTimeValue& value) {
  const std::uint64_t days = value.microseconds / kDay;
  const std::uint64_t rest = value.microseconds % kDay;
  const auto hour = static_cast<unsigned>(rest / (60 * kMinute));
  const auto minute = static_cast<unsigned>(rest / kMinute % 60);
  const auto second = static_cast<unsigned>(rest / kSecond % 60);
  const auto micro = static_cast<unsigned>(rest % kSecond);
  char text[64];
  if (value.interval) {
    if (days > 99999999) return std::nullopt;
    std::snprintf(text, sizeof text, "%08u%02u%02u%02u.%06u:000", static_cast<unsigned>(days), hour, minute, second,
                  micro);
    return std::string(text, kLength);
  }
  constexpr std::uint64_t kDaysTo10000 = 2932897;  // 1970-01-01 to 10000-01-01
  if (days >= kDaysTo10000) return std::nullopt;
  const std::chrono::year_month_day date(
      std::chrono::sys_days(std::chrono::days(static_cast<std::chrono::days::rep>(days))));
  std::snprintf(text, sizeof text, "%04d%02u%02u%02u%02u%02u.%06u+000", static_cast<int>(date.year()),
                static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()), hour, minute, second, micro);
  return std::string(text, kLength);
}

}  // namespace zorva::broker
