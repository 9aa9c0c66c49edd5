#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <locale>
#include <optional>
#include <streambuf>
#include <string_view>
#include <utility>

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

struct Stream {
  explicit Stream(std::string& text) : appender(text), stream(&appender) {}

  StringAppender appender;
  std::ostream stream;
};

// A room does not keep more than this between two lines.
constexpr std::size_t kKeptText = 4096;

// The two hexadecimal digits of each byte.
constexpr std::array<char, 512> kHexPairs = [] {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::array<char, 512> pairs{};
  for (std::size_t byte = 0; byte < 256; ++byte) {
    pairs[2 * byte] = kDigits[byte / 16];
    pairs[2 * byte + 1] = kDigits[byte % 16];
  }
  return pairs;
}();

bool isAsNew(const std::ostream& stream) {
  return stream.flags() == (std::ios_base::skipws | std::ios_base::dec) && stream.width() == 0 &&
         stream.precision() == 6 && stream.fill() == ' ' && stream.good() &&
         stream.exceptions() == std::ios_base::goodbit && stream.tie() == nullptr;
}

}  // namespace

// The buffers that a thread fills now. Trivial, so that the library can be unloaded while the thread goes on.
struct ZAMessageBuffer::Thread {
  unsigned firstPlace;
  unsigned buffers;
};

// What a buffer needs. The next buffer uses it again, so that a line allocates nothing.
class ZAMessageBuffer::Room {
 public:
  std::ostream& stream() {
    if (!isStreaming_ && stream_ && stream_->stream.getloc() != std::locale()) stream_.reset();
    if (!stream_) stream_.emplace(text);
    isStreaming_ = true;
    return stream_->stream;
  }

  // Whether the stream would write an address in digits alone: another locale may group them.
  bool writesPlainDigits() {
    if (!isPlain_.has_value()) isPlain_ = std::locale() == std::locale::classic();
    return *isPlain_;
  }

  void clear() {
    isPlain_.reset();
    if (std::exchange(isStreaming_, false) && !isAsNew(stream_->stream)) stream_.reset();
    text.clear();
    if (text.capacity() > kKeptText) text.shrink_to_fit();
  }

  std::string text;
  Thread* thread = nullptr;  // of the buffer

 private:
  std::optional<Stream> stream_;
  bool isStreaming_ = false;  // in the present line
  std::optional<bool> isPlain_;
};

// Rooms that nobody uses. A thread has two places of its own, or shares them with few: while it composes a line it
// often composes a part of it in a second buffer.
class ZAMessageBuffer::Shelf {
 public:
  constexpr Shelf() = default;

  ~Shelf() {
    for (auto& place : places_) delete place.exchange(nullptr);
  }

  Room* take() {
    Thread& mine = thread();
    Room* room = place(mine, mine.buffers++).exchange(nullptr, std::memory_order_acquire);
    if (room == nullptr) room = new Room;
    room->thread = &mine;
    return room;
  }

  void giveBack(Room* room) {
    Thread& mine = *room->thread;
    room->clear();
    delete place(mine, --mine.buffers).exchange(room, std::memory_order_acq_rel);
  }

 private:
  Thread& thread() {
    static thread_local Thread mine{kPlaces, 0};
    if (mine.firstPlace == kPlaces) mine.firstPlace = 2 * threads_.fetch_add(1, std::memory_order_relaxed) % kPlaces;
    return mine;
  }

  std::atomic<Room*>& place(const Thread& thread, unsigned buffers) { return places_[thread.firstPlace + buffers % 2]; }

  static constexpr unsigned kPlaces = 64;
  std::atomic<unsigned> threads_ = 0;
  std::array<std::atomic<Room*>, kPlaces> places_{};
};

constinit ZAMessageBuffer::Shelf ZAMessageBuffer::shelf_;

ZAMessageBuffer::ZAMessageBuffer() : room_(shelf_.take()) {}

ZAMessageBuffer::~ZAMessageBuffer() { shelf_.giveBack(room_); }

ZAMessageBuffer& ZAMessageBuffer::operator<<(const char* text) {
  if (text != nullptr) room_->text.append(text);
  return *this;
}

ZAMessageBuffer& ZAMessageBuffer::appendAddress(const void* address) {
  if (!room_->writesPlainDigits()) {
    room_->stream() << address;
    return *this;
  }
  char text[2 + 2 * sizeof address];
  char* begin = std::end(text);
  auto rest = reinterpret_cast<std::uintptr_t>(address);
  for (; rest > 0xF; rest >>= 8) std::memcpy(begin -= 2, &kHexPairs[2 * (rest & 0xFF)], 2);
  if (rest != 0 || address == nullptr) *--begin = kHexPairs[2 * rest + 1];
  if (address != nullptr) {
    *--begin = 'x';
    *--begin = '0';
  }
  room_->text.append(begin, static_cast<std::size_t>(std::end(text) - begin));
  return *this;
}

ZAMessageBuffer::operator std::ostream&() { return room_->stream(); }

const std::string& ZAMessageBuffer::str(ZAMessageBuffer&) { return room_->text; }

const std::string& ZAMessageBuffer::str(std::ostream&) { return room_->text; }

}  // namespace ZALog
