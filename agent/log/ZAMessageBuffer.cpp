#include <streambuf>

#include "agent/interface/ZALogger.h"

namespace ZALog {
namespace {

// Appends directly to a string, without its own buffer.
class StringAppender : public std::streambuf {
 public:
  explicit StringAppender(std::string& text) : text_(text) {}

 protected:
  int_type overflow(int_type c) override {
    if (!traits_type::eq_int_type(c, traits_type::eof())) text_ += traits_type::to_char_type(c);
    return traits_type::not_eof(c);
  }

  std::streamsize xsputn(const char* text, std::streamsize count) override {
    text_.append(text, static_cast<std::size_t>(count));
    return count;
  }

 private:
  std::string& text_;
};

// Enough for most lines, so that a line of several pieces needs one allocation.
constexpr std::size_t kFirstRoom = 256;

}  // namespace

struct ZAMessageBuffer::Stream {
  explicit Stream(std::string& text) : appender(text), stream(&appender) {}

  StringAppender appender;
  std::ostream stream;
};

ZAMessageBuffer::ZAMessageBuffer() = default;

ZAMessageBuffer::~ZAMessageBuffer() = default;

ZAMessageBuffer& ZAMessageBuffer::operator<<(const char* text) {
  if (text != nullptr) text_.append(text);
  return *this;
}

ZAMessageBuffer::operator std::ostream&() {
  if (stream_ == nullptr) {
    text_.reserve(kFirstRoom);
    stream_ = std::make_unique<Stream>(text_);
  }
  return stream_->stream;
}

const std::string& ZAMessageBuffer::str(ZAMessageBuffer&) { return text_; }

const std::string& ZAMessageBuffer::str(std::ostream&) { return text_; }

}  // namespace ZALog
