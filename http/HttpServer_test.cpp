// The HTTP side with the tests' own handlers, over real connections.

#include "http/HttpServer.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

#include "access/LoginGate.h"
#include "agent/testing/TemporaryDirectory.h"
#include "http/Listener.h"
#include "http/RequestHead.h"
#include "http/testing/TestServer.h"
#include "http/testing/TestWire.h"

namespace zorva::http {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::HasSubstr;
using testing::Server;
using testing::Wire;
using testing::WireResponse;

const HeaderList kXml{{"Content-Type", "application/xml; charset=\"utf-8\""}};

/// A text of that size without short repetitions.
std::string longText(std::size_t size) {
  std::string text;
  for (std::size_t i = 0; text.size() < size; ++i) text += std::to_string(i * 7919) + "\n";
  text.resize(size);
  return text;
}

/// A gate at which handlers wait.
class Gate {
 public:
  void open() {
    const std::lock_guard lock(mutex_);
    isOpen_ = true;
    changed_.notify_all();
  }
  void wait() {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this] { return isOpen_; });
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  bool isOpen_ = false;
};

/// Answers with the request's body.
void echo(const HttpRequest& request, ResponseSink& sink) {
  sink.begin(200, kXml);
  sink.write(request.body);
}

void answer(ResponseSink& sink, std::string_view text) {
  sink.begin(200, kXml);
  sink.write(text);
}

TEST(HttpServer, AConnectionStaysForTheNextRequest) {
  Server server(echo);
  Wire wire(server.port());
  for (const char* text : {"one", "two", "three"}) {
    ASSERT_TRUE(wire.send(testing::posting(text)));
    const WireResponse response = wire.receive();
    EXPECT_EQ(response.status, 200);
    EXPECT_EQ(response.body, text);
    EXPECT_EQ(response.headers.at("content-length"), std::to_string(response.body.size()));
  }
}

TEST(HttpServer, RequestsThatComeAtOnceAreAnsweredInTheirOrder) {
  Server server(echo);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("one") + testing::posting("two") + testing::posting("three")));
  EXPECT_EQ(wire.receive().body, "one");
  EXPECT_EQ(wire.receive().body, "two");
  EXPECT_EQ(wire.receive().body, "three");
}

TEST(HttpServer, ABodyMayComeInChunksAndInPieces) {
  Server server(echo);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("POST /x HTTP/1.1\r\nHost: localhost\r\nTransfer-Encoding: chunked\r\n\r\n"));
  for (const char* piece : {"3\r\nab", "c\r\n", "A;ext=1\r\n0123456789\r", "\n0\r\n", "\r\n"}) {
    std::this_thread::sleep_for(milliseconds(5));
    ASSERT_TRUE(wire.send(piece));
  }
  EXPECT_EQ(wire.receive().body, "abc0123456789");
}

TEST(HttpServer, ExpectationsAreMetBeforeTheBody) {
  Server server(echo);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("POST /x HTTP/1.1\r\nHost: localhost\r\nContent-Length: 2\r\nExpect: 100-continue\r\n\r\n"));
  EXPECT_EQ(wire.receive().status, 100);
  ASSERT_TRUE(wire.send("ok"));
  EXPECT_EQ(wire.receive().body, "ok");
}

TEST(HttpServer, ALongResponseIsStreamedWhole) {
  const std::string text = longText(3'000'000);
  Server server([&](const HttpRequest&, ResponseSink& sink) { answer(sink, text); });
  Wire wire(server.port());
  for (int i = 0; i < 3; ++i) {
    ASSERT_TRUE(wire.send(testing::posting("x")));
    const WireResponse response = wire.receive();
    EXPECT_EQ(response.headers.at("transfer-encoding"), "chunked");
    EXPECT_TRUE(response.complete);
    EXPECT_TRUE(response.body == text);
  }
}

TEST(HttpServer, AnOldClientGetsALongResponseUpToTheEndOfTheConnection) {
  const std::string text = longText(300'000);
  Server server([&](const HttpRequest&, ResponseSink& sink) { answer(sink, text); });
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("POST /x HTTP/1.0\r\nContent-Length: 1\r\n\r\nx"));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.headers.count("transfer-encoding"), 0U);
  EXPECT_TRUE(response.body == text);
}

TEST(HttpServer, ResponsesAreCompressedForClientsThatAcceptIt) {
  for (const std::size_t size : {std::size_t{5'000}, std::size_t{2'000'000}}) {
    const std::string text = longText(size);
    Server server([&](const HttpRequest&, ResponseSink& sink) { answer(sink, text); });
    Wire wire(server.port());
    ASSERT_TRUE(wire.send(testing::posting("x", "Accept-Encoding: deflate, gzip\r\n")));
    const WireResponse response = wire.receive();
    EXPECT_EQ(response.headers.at("content-encoding"), "gzip");
    EXPECT_LT(response.body.size(), text.size() / 2);
    EXPECT_TRUE(testing::gunzipped(response.body) == text);
    ASSERT_TRUE(wire.send(testing::posting("x", "Accept-Encoding: gzip;q=0\r\n")));
    EXPECT_TRUE(wire.receive().body == text);
  }
}

TEST(HttpServer, NoMoreThanAMebibyteIsEverUnsent) {
  std::atomic<std::size_t> written = 0;
  const std::string piece = longText(50'000);
  Server server([&](const HttpRequest&, ResponseSink& sink) {
    sink.begin(200, kXml);
    for (int i = 0; i < 400; ++i) {
      sink.write(piece);
      written += piece.size();
    }
  });
  Wire wire(server.port(), 4096);
  ASSERT_TRUE(wire.send(testing::posting("x")));
  // The kernel holds data for the client in addition to the server.
  constexpr std::size_t kKernel = std::size_t{6} << 20;
  std::size_t before = 1;
  while (before != written) {
    before = written;
    std::this_thread::sleep_for(milliseconds(200));
  }
  EXPECT_LT(written, (std::size_t{1} << 20) + kKernel);
  EXPECT_LT(written, 400 * piece.size());
  const WireResponse response = wire.receive(seconds(60));
  EXPECT_EQ(response.body.size(), 400 * piece.size());
}

TEST(HttpServer, AFailureAfterTheBeginningIsReportedInTrailers) {
  for (const std::size_t size : {std::size_t{10}, std::size_t{500'000}}) {
    Server server([&](const HttpRequest&, ResponseSink& sink) {
      answer(sink, longText(size));
      sink.fail(1, "the provider has failed: 100 % \n");
    });
    Wire wire(server.port());
    ASSERT_TRUE(wire.send(testing::posting("x", "TE: trailers\r\n")));
    const WireResponse response = wire.receive();
    EXPECT_TRUE(response.complete);
    EXPECT_EQ(response.body.size(), size);
    EXPECT_EQ(response.headers.at("trailer"), "CIMStatusCode, CIMStatusCodeDescription");
    EXPECT_EQ(response.trailers.at("cimstatuscode"), "1");
    EXPECT_EQ(response.trailers.at("cimstatuscodedescription"), "the provider has failed: 100 %25 %0A");
  }
}

TEST(HttpServer, AFailureClosesTheConnectionOfAClientThatTakesNoTrailers) {
  Server server([&](const HttpRequest&, ResponseSink& sink) {
    answer(sink, longText(500'000));
    sink.fail(1, "the provider has failed");
  });
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x")));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.status, 200);
  EXPECT_FALSE(response.complete);
  EXPECT_TRUE(wire.isClosedWithin(seconds(10)));
}

TEST(HttpServer, AHandlerThatThrowsFailsOnlyItsOwnRequest) {
  Server server([](const HttpRequest& request, ResponseSink& sink) {
    if (request.body == "bad") throw std::runtime_error("out of order");
    echo(request, sink);
  });
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("bad")));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.status, 500);
  EXPECT_THAT(response.body, HasSubstr("out of order"));
  ASSERT_TRUE(wire.send(testing::posting("good")));
  EXPECT_EQ(wire.receive().body, "good");
}

TEST(HttpServer, AHandlerThatDoesNotReturnIsGivenUpAndTheOthersGoOn) {
  HttpLimits limits;
  limits.provider = milliseconds(300);
  limits.workers = 1;
  Gate gate;
  Server server(
      [&](const HttpRequest& request, ResponseSink& sink) {
        if (request.body == "hang") gate.wait();
        echo(request, sink);
      },
      limits);
  Wire hanging(server.port());
  Wire other(server.port());
  ASSERT_TRUE(hanging.send(testing::posting("hang")));
  std::this_thread::sleep_for(milliseconds(50));
  ASSERT_TRUE(other.send(testing::posting("go")));
  const WireResponse given = hanging.receive();
  EXPECT_EQ(given.status, 500);
  EXPECT_THAT(given.body, HasSubstr("did not return within"));
  EXPECT_EQ(other.receive().body, "go") << "the only worker is stuck, another takes its place";
  ASSERT_TRUE(hanging.send(testing::posting("again")));
  EXPECT_EQ(hanging.receive().body, "again") << "its connection goes on as well";
  gate.open();
}

TEST(HttpServer, HandlersThatHangKeepNoWorkerFromOthers) {
  HttpLimits limits;
  limits.workers = 4;
  Gate gate;
  std::atomic<int> waiting = 0;
  {
    Server server(
        [&](const HttpRequest& request, ResponseSink& sink) {
          if (request.body == "hang") {
            ++waiting;
            gate.wait();
          }
          echo(request, sink);
        },
        limits);
    std::vector<std::unique_ptr<Wire>> hanging;
    for (int i = 0; i < 40; ++i) {
      hanging.push_back(std::make_unique<Wire>(server.port()));
      EXPECT_TRUE(hanging.back()->send(testing::posting("hang")));
    }
    for (int i = 0; i < 10; ++i) {
      Wire other(server.port());
      EXPECT_TRUE(other.send(testing::posting("go")));
      EXPECT_EQ(other.receive(seconds(10)).body, "go") << i;
    }
    for (int i = 0; i < 1000 && waiting < 40; ++i) std::this_thread::sleep_for(milliseconds(10));
    EXPECT_EQ(waiting, 40) << "and those that wait for a place get one as well";
    gate.open();
    for (const auto& each : hanging) EXPECT_EQ(each->receive().body, "hang");
  }
}

TEST(HttpServer, AHandlerThatDoesNotReturnGetsItsLateAnswer) {
  HttpLimits limits;
  limits.provider = milliseconds(200);
  Gate gate;
  Server server(
      [&](const HttpRequest&, ResponseSink& sink) {
        sink.setLateAnswer([](const std::string& why, ResponseSink& late) { answer(late, "late, since " + why); });
        gate.wait();
      },
      limits);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x")));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.status, 200);
  EXPECT_EQ(response.body, "late, since the provider did not return within 200 ms");
  gate.open();
}

TEST(HttpServer, AHandlerCanSeeThatItWasGivenUp) {
  HttpLimits limits;
  limits.provider = milliseconds(200);
  limits.workers = 1;
  std::atomic<bool> hasSeen = false;
  Server server(
      [&](const HttpRequest& request, ResponseSink& sink) {
        while (request.body == "long" && sink.isWanted()) std::this_thread::sleep_for(milliseconds(1));
        if (!sink.isWanted()) hasSeen = true;
        echo(request, sink);
      },
      limits);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("long")));
  EXPECT_EQ(wire.receive().status, 500);
  ASSERT_TRUE(wire.send(testing::posting("short")));
  EXPECT_EQ(wire.receive().body, "short");
  for (int i = 0; i < 2000 && !hasSeen; ++i) std::this_thread::sleep_for(milliseconds(5));
  EXPECT_TRUE(hasSeen);
}

TEST(HttpServer, AHandlerThatHangsAfterTheBeginningIsReportedInTrailers) {
  HttpLimits limits;
  limits.provider = milliseconds(300);
  Gate gate;
  Server server(
      [&](const HttpRequest&, ResponseSink& sink) {
        answer(sink, longText(200'000));
        gate.wait();
        sink.write("never seen");
      },
      limits);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x", "TE: trailers\r\n")));
  const WireResponse response = wire.receive();
  EXPECT_TRUE(response.complete);
  EXPECT_EQ(response.body.size(), 200'000U);
  EXPECT_EQ(response.trailers.at("cimstatuscode"), "1");
  gate.open();
}

TEST(HttpServer, AClientThatLeavesEndsTheWorkForIt) {
  Gate gone;
  Server server([&](const HttpRequest&, ResponseSink& sink) {
    sink.begin(200, kXml);
    try {
      for (;;) sink.write(longText(60'000));
    } catch (const ClientGone&) {
      gone.open();
      throw;
    }
  });
  {
    Wire wire(server.port());
    ASSERT_TRUE(wire.send(testing::posting("x")));
    EXPECT_FALSE(wire.take(100, seconds(10)).empty());
  }
  gone.wait();
}

TEST(HttpServer, ABodyThatGrowsTooLongIsRefused) {
  HttpLimits limits;
  limits.bodyBytes = 1000;
  Server server(echo, limits);
  Wire wire(server.port());
  std::string request = "POST /x HTTP/1.1\r\nHost: localhost\r\nTransfer-Encoding: chunked\r\n\r\n";
  for (int i = 0; i < 20; ++i) request += "64\r\n" + std::string(100, 'x') + "\r\n";
  ASSERT_TRUE(wire.send(request + "0\r\n\r\n"));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.status, 413);
  EXPECT_THAT(response.body, HasSubstr("1000 bytes"));
}

TEST(HttpServer, UnfinishedBodiesTogetherTakeNoMoreThanTheirShare) {
  HttpLimits limits;
  limits.bodyBytes = 100'000;
  limits.bodiesBytes = 300'000;
  Server server(echo, limits);
  std::vector<std::unique_ptr<Wire>> hoarders;
  for (int i = 0; i < 6; ++i) {
    hoarders.push_back(std::make_unique<Wire>(server.port()));
    ASSERT_TRUE(hoarders.back()->send("POST /x HTTP/1.1\r\nHost: localhost\r\nContent-Length: 100000\r\n\r\n" +
                                      std::string(99'000, 'x')));
    std::this_thread::sleep_for(milliseconds(20));
  }
  EXPECT_TRUE(hoarders[0]->isClosedWithin(seconds(10))) << "the one that has taken longest gives way";
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("works")));
  EXPECT_EQ(wire.receive().body, "works");
}

TEST(HttpServer, ARequestThatTricklesInIsCutOffInTime) {
  HttpLimits limits;
  limits.arrival = milliseconds(400);
  Server server(echo, limits);
  Wire inHead(server.port());
  Wire inBody(server.port());
  ASSERT_TRUE(inHead.send("POST /x HT"));
  ASSERT_TRUE(inBody.send("POST /x HTTP/1.1\r\nHost: localhost\r\nContent-Length: 1000\r\n\r\n"));
  const auto start = std::chrono::steady_clock::now();
  bool headOpen = true;
  bool bodyOpen = true;
  while ((headOpen || bodyOpen) && std::chrono::steady_clock::now() - start < seconds(10)) {
    if (headOpen) headOpen = inHead.send("T") && !inHead.isClosedWithin(milliseconds(10));
    if (bodyOpen) bodyOpen = inBody.send("x") && !inBody.isClosedWithin(milliseconds(10));
  }
  EXPECT_FALSE(headOpen);
  EXPECT_FALSE(bodyOpen);
}

TEST(HttpServer, ASilentConnectionIsCutOffInTime) {
  HttpLimits limits;
  limits.idle = milliseconds(200);
  limits.arrival = milliseconds(300);
  Server server(echo, limits);
  Wire silent(server.port());
  Wire idle(server.port());
  ASSERT_TRUE(idle.send(testing::posting("x")));
  EXPECT_EQ(idle.receive().body, "x");
  EXPECT_TRUE(idle.isClosedWithin(seconds(10)));
  EXPECT_TRUE(silent.isClosedWithin(seconds(10)));
}

TEST(HttpServer, AClientThatTakesNothingOfItsResponseIsCutOff) {
  HttpLimits limits;
  limits.client = milliseconds(300);
  Gate gone;
  Server server(
      [&](const HttpRequest&, ResponseSink& sink) {
        sink.begin(200, kXml);
        try {
          for (;;) sink.write(longText(60'000));
        } catch (const ClientGone&) {
          gone.open();
          throw;
        }
      },
      limits);
  Wire wire(server.port(), 4096);
  ASSERT_TRUE(wire.send(testing::posting("x")));
  gone.wait();
}

TEST(HttpServer, ClientsThatLetTheirResponsesWaitTakeNoWorkerFromOthers) {
  HttpLimits limits;
  limits.workers = 2;
  limits.requests = 8;
  const std::string text = longText(20'000'000);
  Server server(
      [&](const HttpRequest& request, ResponseSink& sink) { answer(sink, request.body == "much" ? text : "little"); },
      limits);
  std::vector<std::unique_ptr<Wire>> slow;
  for (int i = 0; i < 8; ++i) {
    slow.push_back(std::make_unique<Wire>(server.port(), 4096));
    ASSERT_TRUE(slow.back()->send(testing::posting("much")));
  }
  std::this_thread::sleep_for(milliseconds(1500));
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x")));
  EXPECT_EQ(wire.receive().body, "little") << "one of the eight has given way";
}

TEST(HttpServer, AThousandSlowAndHalfOpenClientsLeaveAWorkingOneUnharmed) {
  HttpLimits limits;
  limits.connections = 200;
  Server server(echo, limits);
  Wire working(server.port());
  ASSERT_TRUE(working.send(testing::posting("before")));
  ASSERT_EQ(working.receive().body, "before");

  constexpr const char* kBeginnings[] = {"", "POST /cimom HT", "POST /x HTTP/1.1\r\nHost: localhost\r\nX-Slow: ",
                                         "POST /x HTTP/1.1\r\nHost: localhost\r\nContent-Length: 5000\r\n\r\n<?xml"};
  std::vector<std::unique_ptr<Wire>> slow;
  for (int i = 0; i < 1000; ++i) {
    slow.push_back(std::make_unique<Wire>(server.port()));
    slow.back()->send(kBeginnings[i % 4]);
    if (i % 50 != 0) continue;
    ASSERT_TRUE(working.send(testing::posting("during " + std::to_string(i)))) << i;
    ASSERT_EQ(working.receive(seconds(5)).body, "during " + std::to_string(i));
    Wire newcomer(server.port());
    ASSERT_TRUE(newcomer.send(testing::posting("new"))) << i;
    ASSERT_EQ(newcomer.receive(seconds(5)).body, "new") << i;
  }
  EXPECT_TRUE(slow[0]->isClosedWithin(seconds(10))) << "the oldest of them had to go";
}

TEST(HttpServer, OptionsListTheServersCapabilities) {
  Server server(echo);
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("OPTIONS * HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  const WireResponse response = wire.receive();
  EXPECT_EQ(response.status, 200);
  EXPECT_EQ(response.headers.at("allow"), "POST, M-POST, OPTIONS");
  EXPECT_EQ(response.headers.at("77-cimprotocolversion"), "1.4");
  ASSERT_EQ(response.headers.count("77-cimsupportedmultipleoperations"), 1U);
  EXPECT_EQ(response.headers.at("77-cimsupportedmultipleoperations"), "");
}

TEST(HttpServer, HeaderFieldsWithoutAValueAreSent) {
  Server server([](const HttpRequest&, ResponseSink& sink) {
    sink.begin(200, {{"Content-Type", "application/xml"}, {"Ext", ""}});
    sink.write("x");
  });
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x")));
  const WireResponse response = wire.receive();
  ASSERT_EQ(response.headers.count("ext"), 1U);
  EXPECT_EQ(response.headers.at("ext"), "");
}

TEST(HttpServer, TheRootSaysToAPersonWhatThisIs) {
  Server server(echo, {}, {{"/", textPage("This is a server.\n")}});
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("GET / HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  const WireResponse page = wire.receive();
  EXPECT_EQ(page.status, 200);
  EXPECT_EQ(page.headers.at("content-type"), "text/plain; charset=utf-8");
  EXPECT_EQ(page.body, "This is a server.\n");
  ASSERT_TRUE(wire.send("HEAD / HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n\r\n"));
  const std::string head = wire.take(10000, seconds(20));
  EXPECT_THAT(head, ::testing::StartsWith("HTTP/1.1 200 "));
  EXPECT_THAT(head, ::testing::EndsWith("\r\n\r\n"));
}

/// Lets in whoever sends a field Authorization.
class LoginOnly final : public access::Gate {
 public:
  access::Decision decide(const access::Origin&, const std::string* authorization) override {
    if (authorization == nullptr) return {access::Decision::Kind::NeedsLogin, nullptr, "log in"};
    return {access::Decision::Kind::Admitted, std::make_shared<const access::Client>()};
  }
  access::Decision verify(const access::Origin&, const std::string&) override { return {}; }
};

TEST(HttpServer, APageIsPublicOrForClientsThatTheGateLetsIn) {
  const Page forClients{[](const HttpRequest& request, ResponseSink& sink) {
    sink.begin(200, {{"Content-Type", "text/plain"}});
    sink.write(request.who != nullptr && request.path == "/clients?a=b" ? "for clients" : "for nobody");
  }};
  Server server(echo, {}, {{"/public", textPage("for all")}, {"/clients", forClients}}, std::make_shared<LoginOnly>());
  Wire wire(server.port());
  ASSERT_TRUE(wire.send("GET /public HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  EXPECT_EQ(wire.receive().body, "for all");
  ASSERT_TRUE(wire.send("GET /clients?a=b HTTP/1.1\r\nHost: localhost\r\nAuthorization: Basic x\r\n\r\n"));
  EXPECT_EQ(wire.receive().body, "for clients");
  ASSERT_TRUE(wire.send("GET /clients HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  EXPECT_EQ(wire.receive().status, 401);
}

const std::string kWatch = "GET /watch HTTP/1.1\r\nHost: localhost\r\nAccept-Encoding: gzip\r\n\r\n";

/// A page that keeps its streams.
class Streams {
 public:
  Page page() {
    return {{}, false, [this](const HttpRequest&, const std::shared_ptr<Stream>& stream) -> std::optional<Refusal> {
              const std::lock_guard lock(mutex_);
              if (isFull_) return Refusal{503, "too many watch", {}};
              stream->beginStream({{"Content-Type", "application/x-ndjson"}});
              stream->offer("first\n");
              stream_ = stream;
              arrived_.open();
              return std::nullopt;
            }};
  }
  std::shared_ptr<Stream> next() {
    arrived_.wait();
    const std::lock_guard lock(mutex_);
    return stream_;
  }
  void fill() { isFull_ = true; }

 private:
  std::mutex mutex_;
  Gate arrived_;
  std::shared_ptr<Stream> stream_;
  std::atomic<bool> isFull_ = false;
};

TEST(HttpServer, AStreamGetsWhatIsOfferedAndNeedsNoWorker) {
  HttpLimits limits;
  limits.workers = 1;
  limits.provider = milliseconds(300);
  Streams streams;
  Server server(echo, limits, {{"/watch", streams.page()}});
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(kWatch));
  const std::shared_ptr<Stream> stream = streams.next();
  EXPECT_THAT(wire.take(4096, milliseconds(500)), HasSubstr("first\n"));
  EXPECT_EQ(server.http().streams(), 1U);
  Wire other(server.port());
  ASSERT_TRUE(other.send(testing::posting("x")));
  EXPECT_EQ(other.receive().body, "x");
  EXPECT_TRUE(stream->offer("second\n"));
  EXPECT_THAT(wire.take(4096, milliseconds(500)), HasSubstr("second\n"));
  stream->end();
  EXPECT_THAT(wire.take(4096, milliseconds(500)), HasSubstr("0\r\n"));
  EXPECT_FALSE(stream->offer("third\n"));
  streams.fill();
  ASSERT_TRUE(other.send(kWatch));
  EXPECT_EQ(other.receive().status, 503);
}

TEST(HttpServer, AStreamIsOverWhenItsClientReadsNothing) {
  Streams streams;
  Server server(echo, {}, {{"/watch", streams.page()}});
  Wire wire(server.port(), 4096);
  ASSERT_TRUE(wire.send(kWatch));
  const std::shared_ptr<Stream> stream = streams.next();
  std::size_t taken = 0;
  while (stream->offer(longText(30'000)) && taken < (std::size_t{64} << 20)) taken += 30'000;
  EXPECT_LT(taken, std::size_t{64} << 20) << "what is not read is not kept for ever";
}

TEST(HttpServer, AStreamIsOverWhenItsClientLeaves) {
  Streams streams;
  Server server(echo, {}, {{"/watch", streams.page()}});
  std::shared_ptr<Stream> stream;
  {
    Wire wire(server.port());
    ASSERT_TRUE(wire.send(kWatch));
    stream = streams.next();
  }
  const auto deadline = std::chrono::steady_clock::now() + seconds(20);
  bool goesOn = true;
  while (goesOn && std::chrono::steady_clock::now() < deadline) {
    goesOn = stream->offer("more\n");
    std::this_thread::sleep_for(milliseconds(5));
  }
  EXPECT_FALSE(goesOn);
  while (server.http().streams() > 0 && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(milliseconds(5));
  }
  EXPECT_EQ(server.http().streams(), 0U);
}

TEST(HttpServer, TheEndOfTheServerEndsStreams) {
  Streams streams;
  Server server(echo, {}, {{"/watch", streams.page()}});
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(kWatch));
  const std::shared_ptr<Stream> stream = streams.next();
  EXPECT_TRUE(server.http().stop());
  EXPECT_FALSE(stream->offer("more\n"));
}

TEST(HttpServer, TheEndOfEachRequestIsReported) {
  std::mutex mutex;
  std::vector<RequestEnd> ends;
  Gate both;
  Server server(echo, {}, {{"/x", textPage("a page")}});
  server.http().setRequestHook([&](const RequestEnd& end) {
    const std::lock_guard lock(mutex);
    ends.push_back(end);
    if (ends.size() == 3) both.open();
  });
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("x")));
  wire.receive();
  ASSERT_TRUE(wire.send("GET /x HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  wire.receive();
  ASSERT_TRUE(wire.send("GET /nonesuch HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  wire.receive();
  both.wait();
  EXPECT_EQ(ends[0].status, 200);
  EXPECT_FALSE(ends[0].isForPage);
  EXPECT_GT(ends[0].time.count(), 0);
  EXPECT_EQ(ends[1].status, 200);
  EXPECT_TRUE(ends[1].isForPage);
  EXPECT_EQ(ends[2].status, 405);
}

TEST(HttpServer, ARequestByPostIsNoRequestForAPage) {
  Server server(echo, {}, {{"/x", textPage("a page")}});
  Wire wire(server.port());
  ASSERT_TRUE(wire.send(testing::posting("a body")));
  EXPECT_EQ(wire.receive().body, "a body");
}

TEST(HttpServer, OtherMethodsAreTurnedDown) {
  Server server(echo);
  Wire get(server.port());
  ASSERT_TRUE(get.send("GET /cimom HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  const WireResponse response = get.receive();
  EXPECT_EQ(response.status, 405);
  EXPECT_EQ(response.headers.at("allow"), "POST, M-POST, OPTIONS");
  Wire brew(server.port());
  ASSERT_TRUE(brew.send("BREW / HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  EXPECT_EQ(brew.receive().status, 501);
}

TEST(HttpServer, StopWaitsForRequestsInWorkAndAbandonsTheRest) {
  HttpLimits limits;
  limits.drain = milliseconds(300);
  Gate gate;
  Server server(
      [&](const HttpRequest& request, ResponseSink& sink) {
        if (request.body == "hang") gate.wait();
        if (request.body == "slow") std::this_thread::sleep_for(milliseconds(100));
        echo(request, sink);
      },
      limits);
  Wire slow(server.port());
  Wire hanging(server.port());
  ASSERT_TRUE(slow.send(testing::posting("slow")));
  ASSERT_TRUE(hanging.send(testing::posting("hang")));
  std::this_thread::sleep_for(milliseconds(50));
  EXPECT_FALSE(server.http().stop()) << "a handler is stuck";
  EXPECT_EQ(slow.receive().body, "slow");
  EXPECT_THAT(hanging.receive().body, HasSubstr("the server is ending"));
  gate.open();
}

// ---- Logins ----

using Barrier = Gate;

/// Every login waits at a barrier. Then "right" is let in and "early" must come again; the rest fails. Without a login
/// a client is let in at once.
class SlowGate final : public access::Gate {
 public:
  explicit SlowGate(Barrier& barrier) : barrier_(barrier) {}

  access::Decision decide(const access::Origin&, const std::string* authorization) override {
    if (authorization == nullptr) return {access::Decision::Kind::Admitted, client("anonymous")};
    return {access::Decision::Kind::MustVerify};
  }

  access::Decision verify(const access::Origin&, const std::string& authorization) override {
    barrier_.wait();
    if (authorization == "right") return {access::Decision::Kind::Admitted, client("alice")};
    if (authorization == "early") return {access::Decision::Kind::TooEarly, nullptr, "too early", milliseconds(1200)};
    return {access::Decision::Kind::NeedsLogin, nullptr, "the login is wrong", milliseconds(10)};
  }

 private:
  static access::ClientPtr client(const char* name) {
    return std::make_shared<const access::Client>(
        access::Client{name, access::Proof::Password, access::Grants(access::Role::Read)});
  }

  Barrier& barrier_;
};

class HttpServerLogin : public ::testing::Test {
 protected:
  ~HttpServerLogin() override { gate_.open(); }

  static std::string login(const std::string& text) { return "Authorization: " + text + "\r\n"; }

  static HttpLimits limits() {
    HttpLimits limits;
    limits.drain = milliseconds(50);
    return limits;
  }

  Gate gate_;
  /// Answers with the user and the body.
  Server server_{[](const HttpRequest& request, ResponseSink& sink) {
                   EXPECT_EQ(findHeader(request.headers, "Authorization"), nullptr);
                   answer(sink, request.who->user + " " + request.body);
                 },
                 limits(),
                 {},
                 std::make_shared<SlowGate>(gate_)};
  Wire wire_{server_.port()};
};

TEST_F(HttpServerLogin, ALoginThatIsRightIsAnswered) {
  gate_.open();
  for (const char* body : {"one", "two"}) {
    ASSERT_TRUE(wire_.send(testing::posting(body, login("right"))));
    EXPECT_EQ(wire_.receive().body, std::string("alice ") + body);
  }
}

TEST_F(HttpServerLogin, ALoginThatIsWrongIsRefusedAndMayBeTriedAgain) {
  gate_.open();
  ASSERT_TRUE(wire_.send(testing::posting("x", login("wrong"))));
  const WireResponse response = wire_.receive();
  EXPECT_EQ(response.status, 401);
  EXPECT_EQ(response.headers.at("www-authenticate"), "Basic realm=\"zorvacimd\", charset=\"UTF-8\"");
  EXPECT_EQ(response.body, "the login is wrong\n");
}

TEST_F(HttpServerLogin, WhoIsTooEarlyHearsWhenToComeAgain) {
  gate_.open();
  ASSERT_TRUE(wire_.send(testing::posting("x", login("early"))));
  const WireResponse response = wire_.receive();
  EXPECT_EQ(response.status, 503);
  EXPECT_EQ(response.headers.at("retry-after"), "2");
}

TEST_F(HttpServerLogin, OthersAreServedWhileALoginIsChecked) {
  ASSERT_TRUE(wire_.send(testing::posting("x", login("right"))));
  for (int i = 0; i < 10; ++i) {
    Wire other(server_.port());
    ASSERT_TRUE(other.send(testing::posting("x")));
    EXPECT_EQ(other.receive().body, "anonymous x");
  }
  gate_.open();
  EXPECT_EQ(wire_.receive().body, "alice x");
}

TEST_F(HttpServerLogin, TheBodyIsNotReadBeforeTheClientIsKnown) {
  ASSERT_TRUE(wire_.send("POST /x HTTP/1.1\r\nHost: localhost\r\nContent-Length: 2\r\nExpect: 100-continue\r\n" +
                         login("right") + "\r\n"));
  EXPECT_EQ(wire_.take(1, milliseconds(100)), "");
  gate_.open();
  EXPECT_EQ(wire_.receive().status, 100);
  ASSERT_TRUE(wire_.send("ok"));
  EXPECT_EQ(wire_.receive().body, "alice ok");
}

TEST_F(HttpServerLogin, ALargeBodyAfterALoginArrivesWhole) {
  gate_.open();
  const std::string body = longText(1'000'000);
  ASSERT_TRUE(wire_.send(testing::posting(body, login("right"))));
  EXPECT_TRUE(wire_.receive().body == "alice " + body);
}

TEST_F(HttpServerLogin, AClientMayLeaveWhileItsLoginIsChecked) {
  {
    Wire leaving(server_.port());
    ASSERT_TRUE(leaving.send(testing::posting("x", login("right"))));
    ASSERT_TRUE(wire_.send(testing::posting("x", login("right"))));
    std::this_thread::sleep_for(milliseconds(50));
  }
  gate_.open();
  EXPECT_EQ(wire_.receive().body, "alice x");
}

TEST_F(HttpServerLogin, TheEndDoesNotWaitForALogin) {
  ASSERT_TRUE(wire_.send(testing::posting("x", login("right"))));
  Wire second(server_.port());
  ASSERT_TRUE(second.send(testing::posting("x", login("right"))));
  std::this_thread::sleep_for(milliseconds(50));
  EXPECT_FALSE(server_.http().stop()) << "the gate is stuck";
  EXPECT_EQ(wire_.receive().status, 503);
  EXPECT_EQ(second.receive().status, 503);
}

/// The real gate, for connections that count as encrypted.
class EncryptedGate final : public access::Gate {
 public:
  explicit EncryptedGate(const std::string& users) : gate_({.usersFile = users}) {}

  access::Decision decide(const access::Origin& origin, const std::string* authorization) override {
    return gate_.decide(encrypted(origin), authorization);
  }
  access::Decision verify(const access::Origin& origin, const std::string& authorization) override {
    return gate_.verify(encrypted(origin), authorization);
  }

 private:
  static access::Origin encrypted(access::Origin origin) {
    origin.isEncrypted = true;
    return origin;
  }

  access::LoginGate gate_;
};

TEST(HttpServerUsers, AUserLogsInAndWhoGuessesMustWait) {
  const zorva::agent::testing::TemporaryDirectory directory;
  const std::string users = directory.write("users", "alice:" + access::hashPassword("password") + ":operate\n");
  Server server([](const HttpRequest& request, ResponseSink& sink) { answer(sink, request.who->user); }, {}, {},
                std::make_shared<EncryptedGate>(users));
  const auto responseTo = [&](const std::string& login) {
    Wire wire(server.port());
    EXPECT_TRUE(wire.send(testing::posting("x", "Authorization: Basic " + login + "\r\n")));
    return wire.receive();
  };
  const char* right = "YWxpY2U6cGFzc3dvcmQ=";
  const char* wrong = "YWxpY2U6d3Jvbmc=";
  const char* other = "Ym9iOndyb25n";
  EXPECT_EQ(responseTo(right).body, "alice");
  Wire guessing(server.port());
  ASSERT_TRUE(guessing.send(testing::posting("x", std::string("Authorization: Basic ") + wrong + "\r\n")));
  EXPECT_EQ(guessing.take(1, milliseconds(200)), "") << "the answer is held back";
  EXPECT_EQ(responseTo(right).body, "alice") << "a login that is remembered does not wait";
  EXPECT_EQ(guessing.receive().status, 401);
  EXPECT_EQ(responseTo(wrong).status, 401);
  EXPECT_EQ(responseTo(other).status, 401);
}

}  // namespace
}  // namespace zorva::http
