#include "agent/tree/PlainJson.h"

#include <charconv>
#include <string>

namespace zorva::agent {
namespace {

class PlainReader {
 public:
  PlainReader(std::string_view document, int& line, JsonEvents& events)
      : rest_(document), line_(line), events_(events) {}

  bool read() {
    if (!readValue()) return false;
    skipBlanks();
    return rest_.empty();
  }

 private:
  bool readValue() {
    skipBlanks();
    if (take('{')) return events_.start_object(kUnknownSize) && readMembers() && events_.end_object();
    if (take('[')) return events_.start_array(kUnknownSize) && readElements() && events_.end_array();
    return rest_.starts_with('"') ? readText() && events_.string(text_) : readNumber();
  }

  bool readMembers() {
    if (skipBlanks(), take('}')) return true;
    do {
      skipBlanks();
      if (!readText() || !events_.key(text_)) return false;
      skipBlanks();
      if (!take(':') || !readValue()) return false;
      skipBlanks();
    } while (take(','));
    return take('}');
  }

  bool readElements() {
    if (skipBlanks(), take(']')) return true;
    do {
      if (!readValue()) return false;
      skipBlanks();
    } while (take(','));
    return take(']');
  }

  bool readText() {
    if (!take('"')) return false;
    std::size_t length = 0;
    while (length < rest_.size() && isPlain(rest_[length])) ++length;
    text_.assign(rest_, 0, length);
    rest_.remove_prefix(length);
    return take('"');
  }

  bool readNumber() {
    std::uint64_t number = 0;
    const auto [end, error] = std::from_chars(rest_.data(), rest_.data() + rest_.size(), number);
    const auto length = static_cast<std::size_t>(end - rest_.data());
    if (error != std::errc() || (rest_.front() == '0' && length > 1)) return false;
    rest_.remove_prefix(length);
    return events_.number_unsigned(number);
  }

  void skipBlanks() {
    while (!rest_.empty() && isBlank(rest_.front())) {
      if (rest_.front() == '\n') ++line_;
      rest_.remove_prefix(1);
    }
  }

  bool take(char expected) {
    if (!rest_.starts_with(expected)) return false;
    rest_.remove_prefix(1);
    return true;
  }

  static bool isBlank(char character) {
    return character == ' ' || character == '\n' || character == '\r' || character == '\t';
  }

  static bool isPlain(char character) {
    return character >= ' ' && character <= '~' && character != '"' && character != '\\';
  }

  static constexpr std::size_t kUnknownSize = static_cast<std::size_t>(-1);

  std::string_view rest_;
  int& line_;
  JsonEvents& events_;
  std::string text_;  // the latest one
};

}  // namespace

bool readPlainJson(std::string_view document, int& line, JsonEvents& events) {
  return PlainReader(document, line, events).read();
}

}  // namespace zorva::agent
