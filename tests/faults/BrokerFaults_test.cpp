// The broker fails at each call of a request, in each possible way.

#include "FaultTest.h"

namespace ZV::Test {
namespace {

class BrokerFaults : public FaultTest {
 protected:
  // Whether a call reports failure only by its status. Then it can fail only with a code or by throwing.
  static bool onlyGivesStatus(const std::string& call) {
    return call.starts_with("set") || call.starts_with("return") || call == "addKey";
  }

  static bool hasMode(const std::string& call, Mode mode) {
    return mode == Mode::SetRc || mode == Mode::Throw || !onlyGivesStatus(call);
  }

  std::size_t failEach(const Request& request, Mode mode, const Check& check) {
    SCOPED_TRACE(request.name + ", " + nameOf(mode));
    return failEachCall(
        request,
        [&](std::size_t n, const std::function<void()>& run) {
          broker_.startOver();
          broker_.failAt(n, mode);
          run();
          return broker_.hasFailed();
        },
        check, [mode](const RecordedCall& call) { return hasMode(call.name, mode); });
  }

  // The client's code is that of a call to the broker: the one that failed, or one that asked for a missing name; the
  // name may be missing because it could not be set. Of the modifications, those of the endpoint and of an interface's
  // settings may have their own code.
  static void expectCodeOfTheBroker(const Request& request, std::size_t n, Mode mode, const Ending& ending,
                                    const Usual& usual) {
    const CMPIrc rc = ending.outcome.rc;
    if (rc == CMPI_RC_OK || rc == usual.ending.outcome.rc) return;
    const std::string& failed = ending.outcome.calls.at(n - 1).name;
    if (rc == CMPI_RC_ERR_NOT_FOUND || rc == CMPI_RC_ERR_NO_SUCH_PROPERTY) {
      EXPECT_TRUE(request.name == "GetInstance of a name without keys" || failed == "setProperty" || failed == "addKey")
          << ending.outcome;
    } else if (request.kind == Kind::Modify) {
      EXPECT_TRUE(rc == CMPI_RC_ERR_FAILED || rc == CMPI_RC_ERR_INVALID_PARAMETER) << ending.outcome;
    } else {
      EXPECT_EQ(CMPI_RC_ERR_FAILED, rc) << ending.outcome;
      EXPECT_TRUE(mode == Mode::SetRc || mode == Mode::RcAndNull) << "an unexpected code: " << ending.outcome;
    }
  }

  // An exception that the request throws even without a failure.
  static bool fliesAnyway(const Ending& ending, const Usual& usual) {
    return !usual.ending.returned() && ending.what == usual.ending.what;
  }
};

TEST_P(BrokerFaults, EndAsTheBrokerSaysAndLeaveNothingOver) {
  std::size_t tried = 0;
  for (const Request& request : requests()) {
    for (const Mode mode : kAllStatusModes) {
      tried += failEach(request, mode, [&](std::size_t n, const Ending& ending, const Usual& usual) {
        EXPECT_TRUE(ending.returned() || fliesAnyway(ending, usual)) << "flown: " << ending.what;
        expectCodeOfTheBroker(request, n, mode, ending, usual);
        expectKnownFiles(request, usual);
      });
    }
  }
  report("broker", tried);
}

// Only the endpoint's modification catches an exception, and returns a failure.
TEST_P(BrokerFaults, ExceptionsOfTheBrokerPassOn) {
  std::size_t tried = 0;
  for (const Request& request : requests()) {
    tried += failEach(request, Mode::Throw, [&](std::size_t, const Ending& ending, const Usual& usual) {
      if (ending.returned()) {
        EXPECT_EQ(Kind::Modify, request.kind);
        EXPECT_STREQ("ZORVA_DNSProtocolEndPoint", provider().className);
        EXPECT_EQ(CMPI_RC_ERR_FAILED, ending.outcome.rc);
        EXPECT_THAT(ending.outcome.errors(), ::testing::Contains("Caught Exception : "));
      }
      expectKnownFiles(request, usual);
    });
  }
  report("broker exception", tried);
}

ZV_ON_ALL_HOSTS(BrokerFaults);

}  // namespace
}  // namespace ZV::Test
