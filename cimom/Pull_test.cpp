#include "cimom/Pull.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "cimom/testing/ServiceHarness.h"

namespace zorva::cimom {
namespace {

using std::chrono::seconds;
using testing::className;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;
using testing::text;

PullLimits fewOpen() {
  PullLimits limits;
  limits.maxOpen = 4;
  limits.maxOpenOfClient = 3;
  limits.maxEmptyPulls = 5;
  limits.maxBytes = 1000;
  return limits;
}

class PullTableTest : public ::testing::Test {
 protected:
  std::string open(const std::vector<std::string>& objects, PullForm form = PullForm::Paths,
                   const std::string& client = "user 1") {
    PullObjects rest(table_);
    for (const std::string& object : objects) EXPECT_TRUE(rest.add(object));
    std::string context;
    now_ += std::chrono::milliseconds(1);
    const broker::Status status = table_.keep(client, form, "root/cimv2", rest, seconds(10), context, now_);
    EXPECT_TRUE(status.ok()) << status.message;
    return context;
  }

  std::string openAs(const std::string& client, const std::string& object = "a") {
    return open({object, object}, PullForm::Paths, client);
  }

  bool isOpen(const std::string& context) {
    std::uint64_t left = 0;
    return table_.count(context, "root/cimv2", left, now_).ok();
  }

  std::vector<std::string> take(const std::string& context, std::size_t count) {
    PullObjects taken(table_);
    status_ = table_.take(context, "ROOT/cimv2", PullForm::Paths, count, taken, ended_, now_);
    return {taken.texts().begin(), taken.texts().end()};
  }

  PullTable table_{fewOpen()};
  PullTable::Clock::time_point now_ = PullTable::Clock::now();
  broker::Status status_;
  bool ended_ = false;
};

TEST_F(PullTableTest, GivesObjectsInOrderUntilNoneAreLeft) {
  const std::string context = open({"a", "b", "c"});
  EXPECT_THAT(take(context, 2), ElementsAre("a", "b"));
  EXPECT_FALSE(ended_);
  EXPECT_THAT(take(context, 2), ElementsAre("c"));
  EXPECT_TRUE(ended_);
  take(context, 1);
  EXPECT_EQ(status_.rc, kInvalidEnumerationContext);
}

TEST_F(PullTableTest, KeepsWhatIsAskedForInTime) {
  const std::string context = open({"a", "b", "c"});
  for (int i = 0; i < 5; ++i) {
    now_ += seconds(9);
    take(context, 0);
    EXPECT_TRUE(status_.ok());
  }
  EXPECT_EQ(take(context, 1).size(), 1U);
  now_ += seconds(10);
  take(context, 1);
  EXPECT_EQ(status_.rc, kInvalidEnumerationContext);
  EXPECT_THAT(status_.message, HasSubstr("left alone for longer"));
  EXPECT_EQ(table_.bytes(), 0U);
}

TEST_F(PullTableTest, DropsEnumerationsThatAreNotContinued) {
  const std::string one = open({"a"});
  const std::string other = open({"b"});
  EXPECT_TRUE(isOpen(one));
  EXPECT_TRUE(isOpen(other));
  now_ += seconds(11);
  table_.reclaim(now_);
  EXPECT_EQ(table_.bytes(), 0U);
  now_ -= seconds(11);
  EXPECT_FALSE(isOpen(one));
  EXPECT_FALSE(isOpen(other));
}

TEST_F(PullTableTest, PullsOfNothingRenewTheTimeoutOnlySoOften) {
  const std::string context = open({"a", "b"});
  for (int i = 0; i < 5; ++i) take(context, 0);
  take(context, 1);
  for (int i = 0; i < 5; ++i) {
    take(context, 0);
    EXPECT_TRUE(status_.ok()) << "a pull of objects begins the count anew";
  }
  now_ += seconds(9);
  take(context, 0);
  EXPECT_EQ(status_.rc, kServerLimitsExceeded);
  EXPECT_THAT(status_.message, HasSubstr("more than 5 pulls of zero objects"));
  EXPECT_TRUE(isOpen(context));
  now_ += seconds(1);
  EXPECT_FALSE(isOpen(context)) << "the pull that was refused has renewed nothing";
}

TEST_F(PullTableTest, OfAClientThatHasAsManyAsItMayTheOneThatWaitedLongestGivesWay) {
  const std::string other = openAs("user 2");
  const std::string first = openAs("user 1");
  const std::string second = openAs("user 1");
  const std::string third = openAs("user 1");
  now_ += std::chrono::milliseconds(1);
  EXPECT_EQ(take(first, 1).size(), 1U);
  now_ += std::chrono::milliseconds(1);
  take(second, 0);
  const std::string fourth = openAs("user 1");
  EXPECT_FALSE(isOpen(second)) << "a pull of nothing is no end of waiting";
  for (const std::string& context : {other, first, third, fourth}) EXPECT_TRUE(isOpen(context));
}

TEST_F(PullTableTest, IfTheTableIsFullTheClientThatHasMostLosesOne) {
  const std::string oldest = openAs("user 2");
  const std::string first = openAs("user 1");
  const std::string second = openAs("user 1");
  const std::string third = openAs("user 1");
  const std::string fresh = openAs("user 3");
  EXPECT_FALSE(isOpen(first));
  for (const std::string& context : {oldest, second, third, fresh}) EXPECT_TRUE(isOpen(context));
  const std::string fourth = openAs("user 4");
  EXPECT_FALSE(isOpen(second));
  const std::string fifth = openAs("user 5");
  EXPECT_FALSE(isOpen(oldest)) << "of clients that have as many, the one that waited longest";
  for (const std::string& context : {third, fresh, fourth, fifth}) EXPECT_TRUE(isOpen(context));
}

TEST_F(PullTableTest, IfTheMemoryIsFullTheClientThatHoldsMostLosesOne) {
  const std::string large = openAs("user 1", std::string(236, 'x'));
  const std::string small = openAs("user 2", std::string(36, 'x'));
  const std::string fresh = openAs("user 3", std::string(136, 'x'));
  EXPECT_FALSE(isOpen(large));
  EXPECT_TRUE(isOpen(small));
  EXPECT_TRUE(isOpen(fresh));
  EXPECT_EQ(table_.bytes(), 600U);
}

TEST_F(PullTableTest, AnEnumerationThatIsTooLargeEndsNoSmallerOne) {
  const std::string small = openAs("user 1", std::string(36, 'x'));
  PullObjects huge(table_);
  int added = 0;
  while (huge.add(std::string(36, 'x'))) ++added;
  EXPECT_EQ(added, 8);
  EXPECT_TRUE(isOpen(small));
}

TEST(PullTableOff, KeepsNone) {
  PullLimits limits;
  limits.maxOpen = 0;
  PullTable table(limits);
  PullObjects rest(table);
  ASSERT_TRUE(rest.add("a"));
  std::string context;
  EXPECT_EQ(table.keep("", PullForm::Paths, "n", rest, seconds(1), context).rc, kServerLimitsExceeded);
}

TEST_F(PullTableTest, BoundsTheirMemory) {
  PullObjects many(table_);
  int added = 0;
  while (many.add(std::string(36, 'x'))) ++added;
  EXPECT_EQ(added, 10);
  EXPECT_EQ(table_.bytes(), 1000U);
  PullObjects taken(table_);
  many.moveTo(taken, 4);
  EXPECT_EQ(table_.bytes(), 1000U);
}

TEST_F(PullTableTest, TellsContextsOfOtherNamespacesAndFormsApart) {
  const std::string context = open({"a"}, PullForm::Instances);
  take(context, 1);
  EXPECT_EQ(status_.rc, kInvalidEnumerationContext);
  EXPECT_THAT(status_.message, HasSubstr("use PullInstancesWithPath"));
  EXPECT_EQ(table_.close(context, "interop", now_).rc, kInvalidEnumerationContext);
  EXPECT_TRUE(table_.close(context, "root/cimv2", now_).ok());
  EXPECT_FALSE(isOpen(context));
}

TEST_F(PullTableTest, NamesOfContextsCannotBeGuessed) {
  const std::string one = open({"a"});
  const std::string other = open({"a"});
  EXPECT_EQ(one.size(), 32U);
  EXPECT_NE(one, other);
}

TEST(PullThreads, ManyMayPullAtOnce) {
  PullTable table{PullLimits()};
  PullObjects rest(table);
  for (int i = 0; i < 1000; ++i) ASSERT_TRUE(rest.add("x"));
  std::string context;
  ASSERT_TRUE(table.keep("", PullForm::Paths, "n", rest, seconds(60), context).ok());
  std::atomic<std::size_t> got = 0;
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      bool ended = false;
      while (!ended) {
        PullObjects taken(table);
        if (!table.take(context, "n", PullForm::Paths, 7, taken, ended).ok()) break;
        got += taken.size();
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(got, 1000U);
  std::uint64_t left = 0;
  EXPECT_EQ(table.count(context, "n", left).rc, kInvalidEnumerationContext);
}

// The operations.

std::string contextOf(const std::string& response) {
  const std::string begin = "NAME=\"EnumerationContext\" PARAMTYPE=\"string\"><VALUE>";
  const std::size_t at = response.find(begin);
  return at == std::string::npos ? "" : response.substr(at + begin.size(), 32);
}

constexpr const char* kMore =
    "<PARAMVALUE NAME=\"EndOfSequence\" PARAMTYPE=\"boolean\"><VALUE>FALSE</VALUE></PARAMVALUE>";
constexpr const char* kEnd =
    "<PARAMVALUE NAME=\"EndOfSequence\" PARAMTYPE=\"boolean\"><VALUE>TRUE</VALUE></PARAMVALUE>";

std::string pull(const std::string& context, int count) {
  return text("EnumerationContext", context) + text("MaxObjectCount", std::to_string(count));
}

TEST(PulledOperations, GiveInstancesPieceByPiece) {
  testing::TestService service;
  const std::string opened = service.ask("OpenEnumerateInstances", className("ClassName", "T_Thing"));
  EXPECT_THAT(opened, HasSubstr("<IRETURNVALUE></IRETURNVALUE>"));
  EXPECT_THAT(opened, HasSubstr(kMore));
  const std::string context = contextOf(opened);
  EXPECT_THAT(service.ask("EnumerationCount", text("EnumerationContext", context)),
              HasSubstr("<IRETURNVALUE><VALUE>3</VALUE></IRETURNVALUE>"));
  const std::string first = service.ask("PullInstancesWithPath", pull(context, 2));
  EXPECT_THAT(first, HasSubstr("<VALUE.INSTANCEWITHPATH><INSTANCEPATH><NAMESPACEPATH><HOST>this</HOST>"));
  EXPECT_THAT(first, HasSubstr(kMore));
  EXPECT_EQ(contextOf(first), context);
  const std::string second = service.ask("PullInstancesWithPath", pull(context, 2));
  EXPECT_THAT(second, HasSubstr("T_SpecialThing"));
  EXPECT_THAT(second, HasSubstr(kEnd));
  EXPECT_THAT(service.ask("PullInstancesWithPath", pull(context, 2)), HasSubstr("<ERROR CODE=\"21\""));
}

TEST(PulledOperations, EndAtOnceIfAllIsTaken) {
  testing::TestService service;
  const std::string response =
      service.ask("OpenEnumerateInstancePaths", className("ClassName", "T_Thing") + text("MaxObjectCount", "3"));
  EXPECT_THAT(response, HasSubstr(kEnd));
  EXPECT_EQ(contextOf(response), "");
}

TEST(PulledOperations, CoverAssociationsToo) {
  testing::TestService service;
  const std::string a = testing::parameter("InstanceName", testing::instanceName("T_Thing", {{"Name", "a"}})) +
                        text("MaxObjectCount", "9");
  EXPECT_THAT(service.ask("OpenAssociatorInstances", a + className("ResultClass", "T_Other")),
              HasSubstr("<INSTANCE CLASSNAME=\"T_Other\">"));
  EXPECT_THAT(service.ask("OpenAssociatorInstancePaths", a), HasSubstr("<IRETURNVALUE><INSTANCEPATH>"));
  EXPECT_THAT(service.ask("OpenReferenceInstances", a + text("Role", "Left")),
              HasSubstr("<INSTANCE CLASSNAME=\"T_ThingOther\">"));
  EXPECT_THAT(service.ask("OpenReferenceInstancePaths", a + className("ResultClass", "T_ThingOther")),
              HasSubstr("<INSTANCENAME CLASSNAME=\"T_ThingOther\">"));
}

TEST(PulledOperations, PullPaths) {
  testing::TestService service;
  const std::string context = contextOf(
      service.ask("OpenEnumerateInstancePaths", className("ClassName", "T_Thing") + text("OperationTimeout", "5")));
  EXPECT_THAT(service.ask("PullInstancesWithPath", pull(context, 1)), HasSubstr("use PullInstancePaths"));
  EXPECT_THAT(service.ask("PullInstancePaths", pull(context, 1)), HasSubstr("<IRETURNVALUE><INSTANCEPATH>"));
}

TEST(PulledOperations, CanBeClosed) {
  testing::TestService service;
  const std::string context = contextOf(service.ask("OpenEnumerateInstances", className("ClassName", "T_Thing")));
  const std::string which = text("EnumerationContext", context);
  EXPECT_THAT(service.ask("CloseEnumeration", which), Not(HasSubstr("ERROR")));
  EXPECT_THAT(service.ask("CloseEnumeration", which), HasSubstr("<ERROR CODE=\"21\""));
  EXPECT_THAT(service.ask("EnumerationCount", which), HasSubstr("<ERROR CODE=\"21\""));
}

TEST(PulledOperations, RefuseWhatTheyDoNotOffer) {
  testing::TestService service;
  const auto open = [&](const std::string& parameters) {
    return service.ask("OpenEnumerateInstances", className("ClassName", "T_Thing") + parameters);
  };
  EXPECT_THAT(open(text("OperationTimeout", "0")), HasSubstr("<ERROR CODE=\"22\""));
  EXPECT_THAT(open(text("OperationTimeout", "601")), HasSubstr("must be from 1 to 600 seconds"));
  EXPECT_THAT(open(text("FilterQueryLanguage", "DMTF:FQL") + text("FilterQuery", "a = 1")),
              HasSubstr("<ERROR CODE=\"25\""));
  EXPECT_THAT(open(text("ContinueOnError", "true")), HasSubstr("<ERROR CODE=\"26\""));
  EXPECT_THAT(open(text("ContinueOnError", "false") + text("FilterQuery", "")), HasSubstr(kMore));
  EXPECT_THAT(open(text("MaxObjectCount", "10001")), HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(open(text("MaxObjectCount", "-1")), HasSubstr("must be a uint32"));
}

TEST(PulledOperations, StayWithinTheLimitsOfTheServer) {
  ServiceOptions options;
  options.maxPullBytes = 1500;
  testing::TestService small(options);
  EXPECT_THAT(small.ask("OpenEnumerateInstances", className("ClassName", "T_Thing")),
              HasSubstr("hold more than 1500 bytes"));
}

TEST(PulledOperations, ThatFitTheirFirstAnswerNeedNoPlace) {
  ServiceOptions options;
  options.maxPulls = 1;
  testing::TestService service(options);
  const std::string context = contextOf(service.ask("OpenEnumerateInstances", className("ClassName", "T_Thing")));
  const std::string whole = className("ClassName", "T_Thing") + text("MaxObjectCount", "3");
  EXPECT_THAT(service.ask("OpenEnumerateInstances", whole), HasSubstr(kEnd));
  EXPECT_THAT(service.ask("PullInstancesWithPath", pull(context, 1)), HasSubstr(kMore)) << "and end no other";
}

TEST(PulledOperations, OfOneClientDoNotKeepOthersOut) {
  testing::TestService service;
  const auto openAs = [&](const std::string& client) {
    http::HttpRequest request = testing::request("OpenEnumerateInstances", className("ClassName", "T_Thing"));
    request.client = client;
    return contextOf(service.ask(request).body);
  };
  const std::string one = openAs("user 1");
  for (int i = 0; i < 150; ++i) EXPECT_NE(openAs("user 2"), "");
  EXPECT_THAT(service.ask("PullInstancesWithPath", pull(one, 1)), HasSubstr(kMore));
}

}  // namespace
}  // namespace zorva::cimom
