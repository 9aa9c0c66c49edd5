#include "http/JoinedRecords.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <cerrno>
#include <string>

#include "util/FileDescriptor.h"

namespace zorva::http {
namespace {

/// Two sockets that are connected to each other; neither blocks.
struct Pair {
  explicit Pair(int type) {
    int ends[2];
    if (::socketpair(AF_UNIX, type | SOCK_NONBLOCK, 0, ends) != 0) throw std::runtime_error("no sockets");
    near = util::FileDescriptor(ends[0]);
    far = util::FileDescriptor(ends[1]);
  }

  /// What one read of the far end gives.
  std::string read() const {
    std::string text(std::size_t{1} << 20, '\0');
    const ssize_t size = ::recv(far.get(), text.data(), text.size(), 0);
    text.resize(size < 0 ? 0 : static_cast<std::size_t>(size));
    return text;
  }

  util::FileDescriptor near;
  util::FileDescriptor far;
};

ssize_t sendText(JoinedRecords& records, const std::string& text) { return records.send(text.data(), text.size()); }

TEST(JoinedRecords, OnlyTheTwoThatWereAnnouncedGoTogether) {
  const Pair pair(SOCK_SEQPACKET);  // each call of the system is a packet
  JoinedRecords records(pair.near.get());
  EXPECT_EQ(sendText(records, "first"), 5);
  EXPECT_EQ(pair.read(), "first");
  records.joinNextTwo();
  EXPECT_EQ(sendText(records, "head "), 5);
  EXPECT_EQ(pair.read(), "");
  EXPECT_EQ(sendText(records, "body"), 4);
  EXPECT_EQ(pair.read(), "head body");
  EXPECT_EQ(sendText(records, "last"), 4);
  EXPECT_EQ(pair.read(), "last");
}

TEST(JoinedRecords, LoseNothingWhereTheSocketTakesAPart) {
  const Pair pair(SOCK_STREAM);
  const int small = 4096;
  ASSERT_EQ(::setsockopt(pair.near.get(), SOL_SOCKET, SO_SNDBUF, &small, sizeof small), 0);
  JoinedRecords records(pair.near.get());
  std::string sent;
  std::string received;
  int refusals = 0;
  for (int round = 0; round < 50; ++round) {
    records.joinNextTwo();
    // Longer and shorter than what the socket takes.
    for (const std::size_t size : {std::size_t{100} + 701U * static_cast<std::size_t>(round), std::size_t{9000}}) {
      const std::string record(size, static_cast<char>('a' + round % 26));
      sent += record;
      std::size_t taken = 0;
      while (taken < record.size()) {
        const ssize_t now = records.send(record.data() + taken, record.size() - taken);
        if (now >= 0) {
          taken += static_cast<std::size_t>(now);
          continue;
        }
        ASSERT_EQ(errno, EAGAIN);
        ++refusals;
        received += pair.read();
      }
    }
  }
  for (std::string more = pair.read(); !more.empty(); more = pair.read()) received += more;
  EXPECT_GT(refusals, 0);
  EXPECT_TRUE(received == sent) << received.size() << " of " << sent.size() << " bytes";
}

TEST(JoinedRecords, AClosedConnectionIsAnErrorAndNoSignal) {
  Pair pair(SOCK_STREAM);
  JoinedRecords records(pair.near.get());
  pair.far = util::FileDescriptor();
  EXPECT_EQ(sendText(records, "text"), -1);
  EXPECT_EQ(errno, EPIPE);
}

}  // namespace
}  // namespace zorva::http
