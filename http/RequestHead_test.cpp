#include "http/RequestHead.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::http {
namespace {

using ::testing::HasSubstr;

constexpr std::size_t kMost = 1000;

HeaderList usual() {
  return {{"Host", "localhost"},        {"Content-Type", "application/xml; charset=\"utf-8\""},
          {"Content-Length", "10"},     {"CIMOperation", "MethodCall"},
          {"CIMMethod", "GetInstance"}, {"CIMObject", "root/cimv2"}};
}

/// The usual request with further fields after its own, which replace fields of the same name.
std::optional<Refusal> check(HeaderList more, std::string_view method = "POST", std::string_view version = "HTTP/1.1") {
  HeaderList headers = usual();
  headers.insert(headers.end(), more.begin(), more.end());
  return checkHead({method, "/", version, headers}, kMost);
}

std::optional<Refusal> checkInstead(const std::string& name, const std::string& value) {
  HeaderList headers = usual();
  for (auto& [each, old] : headers) {
    if (each == name) old = value;
  }
  return checkHead({"POST", "/", "HTTP/1.1", headers}, kMost);
}

std::optional<Refusal> checkWithout(const std::string& name, HeaderList more) {
  HeaderList headers = usual();
  std::erase_if(headers, [&](const auto& field) { return field.first == name; });
  headers.insert(headers.end(), more.begin(), more.end());
  return checkHead({"POST", "/", "HTTP/1.1", headers}, kMost);
}

int statusOf(const std::optional<Refusal>& refusal) { return refusal.has_value() ? refusal->status : 200; }

TEST(RequestHead, AUsualRequestGoesOn) {
  EXPECT_EQ(statusOf(check({})), 200);
  EXPECT_EQ(statusOf(check({}, "M-POST")), 200);
  EXPECT_EQ(statusOf(check({{"TE", "trailers"}, {"Accept", "text/xml, application/xml"}})), 200);
  EXPECT_EQ(statusOf(check({{"Expect", "100-continue"}})), 200);
}

TEST(RequestHead, AChunkedBodyGoesOn) {
  EXPECT_EQ(statusOf(checkWithout("Content-Length", {{"Transfer-Encoding", "Chunked"}})), 200);
}

TEST(RequestHead, TwoLengthsAreRefusedEvenIfTheyAreTheSame) {
  const auto refusal = check({{"content-length", "10"}});
  EXPECT_EQ(statusOf(refusal), 400);
  EXPECT_THAT(refusal->why, HasSubstr("content-length"));
  EXPECT_EQ(refusal->cimError, "request-not-valid");
}

TEST(RequestHead, LengthAndCodingTogetherAreRefused) {
  EXPECT_EQ(statusOf(check({{"Transfer-Encoding", "chunked"}})), 400);
}

TEST(RequestHead, OtherCodingsThanChunkedAreRefused) {
  for (const char* coding : {"gzip, chunked", "chunked, chunked", "identity", "xchunked", "chunked;q=1", ""}) {
    EXPECT_EQ(statusOf(checkWithout("Content-Length", {{"Transfer-Encoding", coding}})), 400) << coding;
  }
  EXPECT_EQ(
      statusOf(checkWithout("Content-Length", {{"Transfer-Encoding", "chunked"}, {"Transfer-Encoding", "chunked"}})),
      400);
}

TEST(RequestHead, ChunksBelongToHttp11) {
  HeaderList headers = usual();
  std::erase_if(headers, [](const auto& field) { return field.first == "Content-Length"; });
  headers.emplace_back("Transfer-Encoding", "chunked");
  EXPECT_EQ(statusOf(checkHead({"POST", "/", "HTTP/1.0", headers}, kMost)), 400);
}

TEST(RequestHead, ALengthIsDigitsAndNothingElse) {
  for (const char* length : {"", "+10", "-1", "0x10", "10 ", "1,0", "10,10", "ten"}) {
    EXPECT_EQ(statusOf(checkInstead("Content-Length", length)), 400) << length;
  }
}

TEST(RequestHead, ABodyThatIsTooLongIsRefusedBeforeItComes) {
  EXPECT_EQ(statusOf(checkInstead("Content-Length", "1000")), 200);
  EXPECT_EQ(statusOf(checkInstead("Content-Length", "1001")), 413);
  EXPECT_EQ(statusOf(checkInstead("Content-Length", "99999999999999999999999")), 413);
}

TEST(RequestHead, ABodyNeedsALength) { EXPECT_EQ(statusOf(checkWithout("Content-Length", {})), 411); }

TEST(RequestHead, HeadersOfCimAreGivenOnce) {
  for (const char* name : {"CIMOperation", "cimmethod", "CIMObject", "73-CIMObject"}) {
    const auto refusal = check({{name, "x"}});
    EXPECT_EQ(statusOf(refusal), 400) << name;
    EXPECT_EQ(refusal->cimError, "header-mismatch") << name;
  }
  EXPECT_EQ(statusOf(check({{"73-CIMObject", "x"}, {"74-CIMObject", "x"}}, "M-POST")), 400);
  EXPECT_EQ(statusOf(check({{"Host", "elsewhere"}})), 400);
}

TEST(RequestHead, NamesAndValuesHaveNoCharactersThatHideOthers) {
  EXPECT_EQ(statusOf(check({{"Content-Length ", "10"}})), 400);
  EXPECT_EQ(statusOf(check({{"X\tY", "1"}})), 400);
  EXPECT_EQ(statusOf(check({{"", "1"}})), 400);
  EXPECT_EQ(statusOf(check({{"X", std::string("a\0b", 3)}})), 400);
  EXPECT_EQ(statusOf(check({{"X", "a\rb"}})), 400);
}

TEST(RequestHead, KnownMethodsAreNotAllowedAndOthersNotImplemented) {
  for (const char* method : {"PUT", "DELETE", "TRACE", "CONNECT", "PATCH"}) {
    EXPECT_EQ(statusOf(check({}, method)), 405) << method;
  }
  EXPECT_EQ(statusOf(check({}, "BREW")), 501);
  EXPECT_EQ(statusOf(check({}, "post")), 501) << "methods are told apart by case";
}

TEST(RequestHead, APageNeedsNoBodyAndOtherPathsHaveNone) {
  const HeaderList headers{{"Host", "localhost"}};
  for (const char* method : {"GET", "HEAD"}) {
    EXPECT_EQ(statusOf(checkHead({method, "/", "HTTP/1.1", headers, true}, kMost)), 200) << method;
    const auto refusal = checkHead({method, "/cimom", "HTTP/1.1", headers}, kMost);
    EXPECT_EQ(statusOf(refusal), 405) << method;
    EXPECT_EQ(refusal->allow, "POST, M-POST, OPTIONS");
  }
  EXPECT_EQ(checkHead({"PUT", "/", "HTTP/1.1", headers, true}, kMost)->allow, "GET, HEAD, POST, M-POST, OPTIONS");
}

TEST(RequestHead, CapabilitiesNameNoGroupOfOperationsThatIsNotThere) {
  const HeaderList can = capabilities(false);
  EXPECT_EQ(*findHeader(can, "77-CIMSupportedFunctionalGroups"),
            "basic-read, basic-write, instance-manipulation, association-traversal");
  EXPECT_EQ(*findHeader(can, "Allow"), "POST, M-POST, OPTIONS");
  EXPECT_EQ(*findHeader(capabilities(true), "Allow"), "GET, HEAD, POST, M-POST, OPTIONS");
}

TEST(RequestHead, ContentIsXmlInUtf8) {
  EXPECT_EQ(statusOf(checkInstead("Content-Type", "text/xml")), 200);
  EXPECT_EQ(statusOf(checkInstead("Content-Type", "text/xml; CHARSET=UTF-8")), 200);
  EXPECT_EQ(statusOf(checkInstead("Content-Type", "text/xml; charset=iso-8859-1")), 400);
  EXPECT_EQ(statusOf(checkInstead("Content-Type", "text/html")), 415);
  EXPECT_EQ(statusOf(checkInstead("Content-Type", "")), 415);
  EXPECT_EQ(statusOf(check({{"Content-Encoding", "gzip"}})), 415);
}

TEST(RequestHead, AClientMustTakeWhatThereIs) {
  EXPECT_EQ(statusOf(check({{"Accept", "text/html, image/*"}})), 406);
  EXPECT_EQ(statusOf(check({{"Accept", "text/xml;q=0"}})), 406);
  EXPECT_EQ(statusOf(check({{"Accept", "*/*;q=0.1"}})), 200);
  EXPECT_EQ(statusOf(check({{"Accept-Charset", "utf-16"}})), 406);
}

TEST(RequestHead, UnknownExpectationsFail) { EXPECT_EQ(statusOf(check({{"Expect", "the unexpected"}})), 417); }

TEST(RequestHead, ListsAreReadWithTheirWeights) {
  const HeaderList headers{{"Accept-Encoding", "br;q=1, GZIP ; q=0.5 , deflate;q=0.000"}, {"TE", "trailers"}};
  EXPECT_TRUE(listHas(headers, "accept-encoding", "gzip"));
  EXPECT_FALSE(listHas(headers, "Accept-Encoding", "deflate"));
  EXPECT_FALSE(listHas(headers, "Accept-Encoding", "zip"));
  EXPECT_TRUE(listHas(headers, "TE", "trailers"));
}

}  // namespace
}  // namespace zorva::http
