#pragma once

// Texts, attributes and plain values as XML has them. Output is well-formed UTF-8 for any input: characters that
// XML 1.0 cannot hold, and bytes that are no UTF-8, come out as U+FFFD. The functions append to `out`, keep no state
// and throw only std::bad_alloc; each may be called on any thread.

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>

namespace zorva::cimxml {

/// `text` with XML's special characters escaped, for content and for attributes in double quotes.
void appendEscaped(std::string& out, std::string_view text);

/// A blank and `name="value"`, the value escaped.
void appendAttribute(std::string& out, std::string_view name, std::string_view value);

/// The content of a VALUE element, for each type of a plain value (DSP0201 5.3.1): std::visit(PlainContent(out),
/// value).
class PlainContent {
 public:
  explicit PlainContent(std::string& text) : out(text) {}

  void operator()(std::monostate) const {}
  void operator()(bool value) const { out += value ? "TRUE" : "FALSE"; }
  void operator()(std::uint64_t value) const;
  void operator()(std::int64_t value) const;
  /// With a decimal point; values that are not numbers have special words.
  void operator()(double value) const;
  /// One unit of UTF-16.
  void operator()(char16_t value) const;
  void operator()(const std::string& value) const { appendEscaped(out, value); }

 protected:
  std::string& out;
};

}  // namespace zorva::cimxml
