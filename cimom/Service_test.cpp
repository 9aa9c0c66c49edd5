#include "cimom/Service.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <semaphore>
#include <thread>

#include "cimom/testing/ServiceHarness.h"
#include "cimxml/testing/Grammar.h"

namespace zorva::cimom {
namespace {

using testing::className;
using testing::CollectingSink;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using testing::intrinsic;
using ::testing::IsEmpty;
using testing::message;
using ::testing::Not;
using testing::post;
using testing::TestService;

const std::string kThings = className("ClassName", "T_Thing");

http::HttpRequest good() { return testing::request("EnumerateInstanceNames", kThings); }

/// A good request with one header changed, or removed if `value` is empty.
http::HttpRequest with(const std::string& name, const std::string& value) {
  http::HttpRequest request = good();
  std::erase_if(request.headers, [&](const auto& field) { return field.first == name; });
  if (!value.empty()) request.headers.emplace_back(name, value);
  return request;
}

TEST(Service, AnswersInOnePieceWhatIsSmall) {
  TestService service;
  const CollectingSink sink = service.ask(good());
  EXPECT_EQ(sink.status, 200);
  EXPECT_EQ(sink.pieces, 1U);
  EXPECT_EQ(sink.header("Content-Type"), "application/xml; charset=\"utf-8\"");
  EXPECT_THAT(sink.body, HasSubstr("<MESSAGE ID=\"42\" PROTOCOLVERSION=\"1.0\">"));
}

TEST(Service, SendsWhatIsLargeWhileItGrows) {
  ServiceOptions options;
  options.unsentText = 200;
  TestService service(options);
  const CollectingSink sink = service.ask(testing::request("EnumerateInstances", kThings));
  EXPECT_GT(sink.pieces, 3U);
  EXPECT_LT(sink.largestPiece, 2000U);
}

TEST(Service, ReportsALateFailureThroughTheSink) {
  ServiceOptions options;
  options.unsentText = 100;
  TestService service(options);
  const CollectingSink sink = service.ask(testing::request("EnumerateInstances", className("ClassName", "T_Trouble")));
  EXPECT_EQ(sink.status, 200);
  ASSERT_TRUE(sink.failure.has_value());
  EXPECT_EQ(sink.failure->first, 1U);
  EXPECT_THAT(sink.failure->second, HasSubstr("half way"));
  EXPECT_THAT(sink.body, Not(HasSubstr("</CIM>")));
}

TEST(Service, EndsTheProviderWhenTheClientHasGone) {
  ServiceOptions options;
  options.unsentText = 100;
  TestService service(options);
  CollectingSink sink;
  sink.goneAfter = 1;
  EXPECT_THROW(service.service().handle(testing::request("EnumerateInstances", kThings), sink), http::ClientGone);
  EXPECT_THAT(service.ask("EnumerateInstanceNames", kThings), HasSubstr("T_SpecialThing"));
}

TEST(Service, AnswersEachOfSeveralRequests) {
  TestService service;
  const std::string body = message("<MULTIREQ>" + intrinsic("EnumerateClassNames", "") +
                                   intrinsic("GetClass", className("ClassName", "No")) +
                                   intrinsic("EnumerateInstanceNames", kThings) + "</MULTIREQ>");
  const CollectingSink sink = service.ask(post(body, {{"CIMOperation", "MethodCall"}, {"CIMBatch", ""}}));
  EXPECT_EQ(sink.status, 200);
  EXPECT_THAT(sink.body, HasSubstr("<MULTIRSP><SIMPLERSP><IMETHODRESPONSE NAME=\"EnumerateClassNames\">"));
  EXPECT_THAT(sink.body, HasSubstr("<IMETHODRESPONSE NAME=\"GetClass\"><ERROR CODE=\"6\""));
  EXPECT_THAT(sink.body, HasSubstr("<IMETHODRESPONSE NAME=\"EnumerateInstanceNames\"><IRETURNVALUE><INSTANCENAME"));
}

TEST(Service, AnswersByMPost) {
  TestService service;
  http::HttpRequest request = good();
  request.method = "M-POST";
  request.headers = {{"Man", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73"},
                     {"73-CIMOperation", "MethodCall"},
                     {"73-CIMMethod", "EnumerateInstanceNames"},
                     {"73-CIMObject", "root%2Fcimv2"}};
  const CollectingSink sink = service.ask(request);
  EXPECT_EQ(sink.status, 200);
  EXPECT_EQ(sink.header("73-CIMOperation"), "MethodResponse");
  EXPECT_EQ(sink.header("Man"), "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
  EXPECT_EQ(sink.header("Cache-Control"), "no-cache");
  request.headers[0].second = "http://example.org/other ; ns=73";
  EXPECT_EQ(service.ask(request).status, 510);
}

TEST(Service, TakesHeadersThatArePercentEncodedOrInAnotherCase) {
  TestService service;
  EXPECT_EQ(service.ask(with("CIMObject", "ROOT%2fcimv2")).status, 200);
  EXPECT_EQ(service.ask(with("CIMObject", "/root/cimv2/")).status, 200);
  EXPECT_EQ(service.ask(with("CIMMethod", "enumerateinstancenames")).status, 200);
  EXPECT_EQ(service.ask(with("CIMMethod", "%45numerateInstanceNames")).status, 200);
  EXPECT_EQ(service.ask(with("CIMProtocolVersion", "1.4")).status, 200);
}

TEST(Service, RefusesHeadersThatDoNotFit) {
  TestService service;
  const std::pair<http::HttpRequest, const char*> cases[] = {
      {with("CIMOperation", ""), "the header CIMOperation is missing: this is no CIM request"},
      {with("CIMOperation", "Other"), "the header CIMOperation must be MethodCall"},
      {with("CIMMethod", ""), "the header CIMMethod is missing"},
      {with("CIMMethod", "GetClass"), "the header CIMMethod is \"GetClass\", but the body has"},
      {with("CIMMethod", "%4"), "the header CIMMethod is not UTF-8 in percent-encoding"},
      {with("CIMObject", ""), "the header CIMObject is missing"},
      {with("CIMObject", "root/other"), "the header CIMObject is \"root/other\", but the body has the namespace"},
      {with("CIMObject", "root%FFcimv2"), "the header CIMObject is not UTF-8"},
      {with("cimobject", "root/cimv2"), "the header CIMObject is given twice"},
      {with("CIMBatch", "1"), "the header CIMBatch needs a MULTIREQ"},
  };
  for (const auto& [request, problem] : cases) {
    const CollectingSink sink = service.ask(request);
    EXPECT_EQ(sink.status, 400) << problem;
    EXPECT_EQ(sink.header("CIMError"), "header-mismatch") << problem;
    EXPECT_THAT(sink.body, HasSubstr(problem));
    EXPECT_THAT(service.lines(), Contains(HasSubstr(problem)));
  }
  const CollectingSink batch =
      service.ask(post(message("<MULTIREQ>" + intrinsic("A", "") + intrinsic("B", "") + "</MULTIREQ>"),
                       {{"CIMOperation", "MethodCall"}, {"CIMMethod", "A"}}));
  EXPECT_EQ(batch.header("CIMError"), "header-mismatch");
}

TEST(Service, ComparesTheObjectOfAMethodCallWithItsHeader) {
  TestService service;
  const auto ask = [&](const std::string& object) {
    return service.ask(
        post(message(testing::extrinsic("Echo", testing::instanceName("T_Thing", {{"Name", "a b"}}), "")),
             {{"CIMOperation", "MethodCall"}, {"CIMMethod", "Echo"}, {"CIMObject", object}}));
  };
  EXPECT_EQ(ask("root/cimv2:T_Thing.Name=\"a b\"").status, 200);
  EXPECT_EQ(ask("root%2Fcimv2%3At_thing.name%3D%22a%20b%22").status, 200);
  EXPECT_EQ(ask("//somewhere/root/cimv2:T_Thing.Name=\"a b\"").status, 200);
  EXPECT_EQ(ask("root/cimv2:T_Thing.Name=\"other\"").status, 400);
  EXPECT_EQ(ask("root/cimv2:T_Other.Name=\"a b\"").status, 400);
  EXPECT_EQ(ask("root/cimv2:T_Thing.Name=\"a b").status, 400);
  EXPECT_EQ(ask("root/cimv2:T_Thing").status, 400);
  EXPECT_EQ(ask("interop:T_Thing.Name=\"a b\"").status, 400);
}

TEST(Service, RefusesBodiesAsTheStandardNamesThem) {
  struct Case {
    std::string body;
    int status;
    const char* error;
  };
  const Case cases[] = {
      {"", 400, "request-not-well-formed"},
      {"<CIM>", 400, "request-not-well-formed"},
      {std::string(1000, '<'), 400, "request-not-well-formed"},
      {"\xFF\xFE", 400, "request-not-well-formed"},
      {"<CIM CIMVERSION='2.0' DTDVERSION='2.0'/>", 400, "request-not-loosely-valid"},
      {"<CIM CIMVERSION='1.0' DTDVERSION='2.0'/>", 501, "unsupported-cim-version"},
      {"<CIM CIMVERSION='2.0' DTDVERSION='3.0'/>", 501, "unsupported-dtd-version"},
      {"<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' PROTOCOLVERSION='9.0'/></CIM>", 501,
       "unsupported-protocol-version"},
      {message("<SIMPLEEXPREQ/>"), 501, "unsupported-operation"},
  };
  TestService service;
  for (const Case& one : cases) {
    http::HttpRequest request = good();
    request.body = one.body;
    const CollectingSink sink = service.ask(request);
    EXPECT_EQ(sink.status, one.status) << one.body;
    EXPECT_EQ(sink.header("CIMError"), one.error) << one.body;
    EXPECT_THAT(sink.body, Not(IsEmpty()));
  }
  EXPECT_EQ(service.ask(with("CIMProtocolVersion", "2.0")).header("CIMError"), "unsupported-protocol-version");
  EXPECT_EQ(service.ask(post("", {{"CIMExport", "MethodRequest"}})).header("CIMError"), "unsupported-operation");
}

TEST(Service, BoundsTheDepthOfARequest) {
  ServiceOptions options;
  options.maxDepth = 20;
  TestService service(options);
  std::string inner = "<INSTANCENAME CLASSNAME='C'/>";
  for (int i = 0; i < 10; ++i) {
    inner = "<INSTANCENAME CLASSNAME='C'><KEYBINDING NAME='K'><VALUE.REFERENCE>" + inner +
            "</VALUE.REFERENCE></KEYBINDING></INSTANCENAME>";
  }
  http::HttpRequest request = good();
  request.body = message(intrinsic("GetInstance", testing::parameter("InstanceName", inner)));
  const CollectingSink sink = service.ask(request);
  EXPECT_EQ(sink.status, 400);
  EXPECT_THAT(sink.body, HasSubstr("elements nested deeper than 20"));
}

TEST(Service, AnswersOnManyThreadsAtOnce) {
  TestService service;
  std::atomic<int> answered = 0;
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      for (int j = 0; j < 25; ++j) {
        const CollectingSink open = service.ask(testing::request("OpenEnumerateInstances", kThings));
        const CollectingSink read = service.ask(testing::request("EnumerateInstances", kThings));
        if (open.status == 200 && read.body.find("T_SpecialThing") != std::string::npos) ++answered;
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(answered, 100);
}

TEST(Service, LogsNoLinesThatAClientMakesUp) {
  TestService service;
  service.ask("GetClass", className("ClassName", "No&#10;2026 forged"));
  for (const std::string& line : service.lines()) EXPECT_THAT(line, Not(HasSubstr("\n")));
  EXPECT_THAT(service.lines(), Contains(HasSubstr("No?2026 forged")));
}

TEST(Service, LogsEachOperationThatFails) {
  TestService service;
  service.ask("GetClass", className("ClassName", "No"));
  EXPECT_THAT(service.lines(), Contains("GetClass in \"root/cimv2\": CIM_ERR_NOT_FOUND: there is no class \"No\" in "
                                        "root/cimv2"));
}

/// A sink whose work can be abandoned.
class ImpatientSink : public CollectingSink {
 public:
  void setLateAnswer(http::LateAnswer answer) override { late = std::move(answer); }
  bool isWanted() const override { return looks++ < patience; }

  http::LateAnswer late;
  int patience = 1'000'000;
  mutable int looks = 0;
};

TEST(Service, LeavesALateAnswerInWhichEachOperationHasFailed) {
  TestService service;
  ImpatientSink sink;
  {
    // The late answer may be written after the request is destroyed.
    const auto request = std::make_unique<http::HttpRequest>(
        post(message("<MULTIREQ>" + intrinsic("EnumerateInstanceNames", kThings) +
                     testing::extrinsic("M", testing::instanceName("T_Thing", {{"Name", "a"}}), "") + "</MULTIREQ>"),
             {{"CIMOperation", "MethodCall"}}));
    service.service().handle(*request, sink);
  }
  ASSERT_TRUE(sink.late);
  CollectingSink late;
  sink.late("it took too long", late);
  EXPECT_EQ(late.status, 200);
  EXPECT_EQ(late.header("CIMOperation"), "MethodResponse");
  EXPECT_THAT(late.body, HasSubstr("<MESSAGE ID=\"42\""));
  EXPECT_THAT(late.body, HasSubstr("<IMETHODRESPONSE NAME=\"EnumerateInstanceNames\"><ERROR CODE=\"1\" "
                                   "DESCRIPTION=\"it took too long\"/>"));
  EXPECT_THAT(late.body, HasSubstr("<METHODRESPONSE NAME=\"M\"><ERROR CODE=\"1\""));
  EXPECT_EQ(cimxml::testing::grammarProblem(late.body), "");
}

TEST(Service, StopsReadingIfTheClientNoLongerWaits) {
  TestService service;
  std::string extra;
  for (int i = 0; i < 50'000; ++i) extra += "<EXTRA/>";
  ImpatientSink sink;
  sink.patience = 3;
  service.service().handle(testing::request("EnumerateInstanceNames", kThings + extra), sink);
  EXPECT_EQ(sink.looks, 4);
  EXPECT_EQ(sink.status, 503);
  EXPECT_FALSE(sink.late) << "what was not read has no late answer but that of HTTP";
}

/// A sink that blocks its request at the first look, until the test releases it.
class StoppingSink : public CollectingSink {
 public:
  bool isWanted() const override {
    reached.release();
    mayGoOn.acquire();
    mayGoOn.release();
    return true;
  }

  mutable std::counting_semaphore<> reached{0};  ///< one more for each look
  mutable std::binary_semaphore mayGoOn{0};
};

TEST(Service, ReadsOneLargeBodyAtATimeAndSmallOnesBesideIt) {
  TestService service;
  std::string extra;
  for (int i = 0; i < 50'000; ++i) extra += "<EXTRA/>";
  const http::HttpRequest large = testing::request("EnumerateInstanceNames", kThings + extra);
  StoppingSink first;
  std::thread reader([&] { service.service().handle(large, first); });
  first.reached.acquire();
  ImpatientSink second;
  second.patience = 0;
  EXPECT_THROW(service.service().handle(large, second), http::ClientGone);
  EXPECT_EQ(second.status, 0) << "its turn did not come";
  EXPECT_EQ(service.ask(good()).status, 200);
  first.mayGoOn.release();
  reader.join();
  EXPECT_EQ(first.status, 200);
  EXPECT_EQ(service.ask(large).status, 200);
}

}  // namespace
}  // namespace zorva::cimom
