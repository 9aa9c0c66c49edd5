#pragma once

// The text format of Prometheus, version 0.0.4.

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

namespace zorva::metrics {

inline constexpr const char* kContentType = "text/plain; version=0.0.4; charset=utf-8";

enum class Type : std::uint8_t { Counter, Gauge, Histogram };

using Label = std::pair<std::string_view, std::string_view>;
using Labels = std::initializer_list<Label>;

/// Writes families of samples one after another. Names of metrics and labels are the caller's own constants; values of
/// labels are any bytes and come out escaped, at most kLongestLabel bytes long, as UTF-8.
class Exposition {
 public:
  static constexpr std::size_t kLongestLabel = 256;

  /// The samples that follow belong to this family, until the next one. A family without samples is not written.
  void family(std::string_view name, Type type, std::string_view help);

  /// A sample of the family.
  void sample(Labels labels, double value);

  /// A sample whose name has a suffix, as those of a histogram have: "_bucket".
  void sample(std::string_view suffix, Labels labels, double value);

  /// A family with one sample, which has no labels.
  void single(std::string_view name, Type type, std::string_view help, double value);

  /// The text of another one, whole.
  void append(const Exposition& other);

  const std::string& text() const noexcept { return text_; }

 private:
  void beginFamily();

  std::string text_;
  std::string name_;
  std::string help_;
  Type type_ = Type::Gauge;
  bool isBegun_ = false;
};

}  // namespace zorva::metrics
