#include "dns/Message.h"

#include <iterator>

#include "util/Names.h"

namespace zorva::dns {

namespace {

constexpr std::size_t kHeader = 12;
constexpr std::size_t kLongestLabel = 63;
constexpr std::size_t kLongestName = 255;  // on the wire, with the root's empty label
constexpr std::uint16_t kClassInternet = 1;
constexpr unsigned kPointerBits = 0xC0;

void append16(std::string& message, unsigned value) {
  message += static_cast<char>(value >> 8U);
  message += static_cast<char>(value & 0xFFU);
}

std::string_view withoutFinalDot(std::string_view name) noexcept {
  if (name.ends_with('.')) name.remove_suffix(1);
  return name;
}

/// Takes a message apart from its beginning. After the first failure everything is empty.
class Reader {
 public:
  Reader(std::string_view message, std::size_t at) : message_(message), at_(at) {}

  bool failed() const noexcept { return !problem_.empty(); }
  const std::string& problem() const noexcept { return problem_; }

  unsigned read16() {
    if (!has(2)) return 0;
    const unsigned value = byteAt(at_) << 8U | byteAt(at_ + 1);
    at_ += 2;
    return value;
  }

  void skip(std::size_t count) {
    if (has(count)) at_ += count;
  }

  /// The labels with dots between them; the root is the empty text.
  std::string readName() {
    std::string name;
    std::size_t from = at_;   // of this part of the name
    std::size_t place = at_;  // of the next label
    std::size_t after = 0;    // the name ends after its first pointer
    std::size_t onWire = 1;   // bytes of the whole name
    while (!failed() && readLabel(name, place, onWire)) {
      if (byteAt(place) < kPointerBits) {
        place += 1 + byteAt(place);
        continue;
      }
      const std::size_t target = (byteAt(place) & ~kPointerBits) << 8U | byteAt(place + 1);
      if (after == 0) after = place + 2;
      if (target >= from) fail("a name points at itself or behind");
      from = place = target;
    }
    at_ = after != 0 ? after : place + 1;
    return failed() ? std::string() : name;
  }

 private:
  unsigned byteAt(std::size_t place) const { return static_cast<unsigned char>(message_[place]); }

  void fail(const char* what) {
    if (problem_.empty()) problem_ = what;
  }

  bool has(std::size_t count) {
    if (!failed() && count > message_.size() - at_) fail("it ends too early");
    return !failed();
  }

  /// Appends the label at `place`, if there is one; false at the end of the name. A pointer is left to the caller.
  bool readLabel(std::string& name, std::size_t place, std::size_t& onWire) {
    if (place >= message_.size()) return fail("a name ends too early"), false;
    const unsigned length = byteAt(place);
    if (length == 0) return false;
    if (length >= kPointerBits) {
      if (place + 1 >= message_.size()) fail("a pointer ends too early");
      return !failed();
    }
    onWire += 1 + length;
    if (length > kLongestLabel) fail("a label is of no known kind");
    if (onWire > kLongestName) fail("a name is longer than 255 bytes");
    if (!failed() && length >= message_.size() - place) fail("a label ends too early");
    if (failed()) return false;
    if (!name.empty()) name += '.';
    name += message_.substr(place + 1, length);
    return true;
  }

  std::string_view message_;
  std::size_t at_;
  std::string problem_;
};

MessageError foreign(const char* what) { return {true, what}; }

struct Header {
  unsigned id;
  unsigned flags;
  unsigned questions;
  unsigned answers;

  bool isResponse() const noexcept { return (flags & 0x8000U) != 0; }
  unsigned operation() const noexcept { return flags >> 11U & 0xFU; }
  bool isTruncated() const noexcept { return (flags & 0x0200U) != 0; }
  ResponseCode code() const noexcept { return static_cast<ResponseCode>(flags & 0xFU); }
};

/// Whether the question section is that of the query. A server that refuses may leave it out.
bool repeats(Reader& reader, const Header& header, const Question& question) {
  if (header.questions == 0) return header.code() != ResponseCode::NoError;
  if (header.questions != 1) return false;
  const std::string name = reader.readName();
  const unsigned type = reader.read16();
  const unsigned itsClass = reader.read16();
  return !reader.failed() && type == static_cast<unsigned>(question.type) && itsClass == kClassInternet &&
         util::sameName(name, withoutFinalDot(question.name));
}

/// Reads the records of the answer section and counts those of that type.
std::size_t countAnswers(Reader& reader, unsigned records, Type type) {
  std::size_t count = 0;
  for (unsigned i = 0; i < records && !reader.failed(); ++i) {
    reader.readName();
    const unsigned itsType = reader.read16();
    const unsigned itsClass = reader.read16();
    reader.skip(4);  // time to live
    reader.skip(reader.read16());
    if (itsType == static_cast<unsigned>(type) && itsClass == kClassInternet && !reader.failed()) ++count;
  }
  return count;
}

}  // namespace

const char* typeName(Type type) noexcept { return type == Type::A ? "A" : "SOA"; }

bool isName(std::string_view name) noexcept {
  if (name == ".") return true;
  name = withoutFinalDot(name);
  if (name.empty() || name.size() + 2 > kLongestName) return false;
  while (true) {
    const std::size_t label = name.find('.');
    const std::size_t length = label == std::string_view::npos ? name.size() : label;
    if (length == 0 || length > kLongestLabel) return false;
    if (label == std::string_view::npos) return true;
    name.remove_prefix(label + 1);
  }
}

std::string encodeQuery(std::uint16_t id, const Question& question) {
  constexpr unsigned kRecursionDesired = 0x0100;
  std::string message;
  append16(message, id);
  append16(message, kRecursionDesired);
  for (const unsigned count : {1U, 0U, 0U, 0U}) append16(message, count);
  std::string_view name = withoutFinalDot(question.name);
  while (!name.empty()) {
    const std::string_view label = name.substr(0, name.find('.'));
    message += static_cast<char>(label.size());
    message += label;
    name.remove_prefix(label.size() < name.size() ? label.size() + 1 : label.size());
  }
  message += '\0';
  append16(message, static_cast<unsigned>(question.type));
  append16(message, kClassInternet);
  return message;
}

std::string codeName(ResponseCode code) {
  constexpr const char* kNames[] = {"NOERROR", "FORMERR", "SERVFAIL", "NXDOMAIN", "NOTIMP", "REFUSED"};
  const auto number = static_cast<std::size_t>(code);
  return number < std::size(kNames) ? kNames[number] : "code " + std::to_string(number);
}

Expected<Response, MessageError> decodeResponse(std::string_view message, std::uint16_t id, const Question& question) {
  if (message.size() < kHeader) return unexpected(foreign("it is shorter than a header"));
  Reader reader(message, 0);
  Header header{reader.read16(), reader.read16(), reader.read16(), reader.read16()};
  reader.skip(4);  // the counts of the other sections
  if (header.id != id) return unexpected(foreign("it has another id"));
  if (!header.isResponse() || header.operation() != 0) return unexpected(foreign("it is no response to a query"));
  if (!repeats(reader, header, question)) return unexpected(foreign("it answers another question"));
  Response response{header.code(), header.isTruncated(), 0};
  response.answers = countAnswers(reader, header.answers, question.type);
  if (reader.failed() && !response.isTruncated) return unexpected(MessageError{false, reader.problem()});
  return response;
}

}  // namespace zorva::dns
