// The instrumentation throws at each call of a request: a std::exception, or something else.

#include <string_view>

#include "FaultTest.h"
#include "agent/Seams.h"
#include "tests/support/Places.h"
#include "util/NotCopied.h"

namespace ZV::Test {
namespace {

using zorva::agent::TreeCall;

// Records each call of the tree with its place among the log lines.
class TreeCalls : private zorva::agent::TreeCallHook, zorva::util::NotCopied {
 public:
  TreeCalls() { zorva::agent::setTreeCallHook(this); }
  ~TreeCalls() override { zorva::agent::setTreeCallHook(nullptr); }

  struct Placed {
    TreeCall call;
    std::size_t place;
  };
  const std::vector<Placed>& all() const { return all_; }

 private:
  void before(TreeCall call) override { all_.push_back({call, nextPlace()}); }

  std::vector<Placed> all_;
};

// The effect of an exception that a call of the tree throws.
enum class Fate {
  Flies,         // to the server, unchanged
  CaughtIfStd,   // logged as "Caught Exception" if it is a std::exception
  CaughtAlways,  // logged as a node that could not be selected
};

class TreeFaults : public FaultTest {
 protected:
  // Three functions catch exceptions while they run; the log shows when that is. The walk of the clients does so only
  // after it has made its cursor.
  static bool isHeldBack(const std::vector<TreeCalls::Placed>& calls, std::size_t n, const LogLines& lines) {
    bool isInside = false;
    bool hasCursor = false;
    const LogLine* latest = nullptr;
    for (const LogLine& line : lines) {
      if (line.place > calls[n].place) break;
      if (line.kind() != LineKind::Entering && line.kind() != LineKind::Exiting) continue;
      const std::string function = line.subject();
      const bool isClientWalk = function == "getDNSClientInstances";
      if (!isClientWalk && function != "getDNSServerInstances" && function != "modifyDNSProtocolEndpointCMPIInstance") {
        continue;
      }
      isInside = line.kind() == LineKind::Entering;
      hasCursor = !isClientWalk;
      latest = &line;
    }
    if (!isInside) return false;
    return hasCursor || (n > 0 && calls[n - 1].place > latest->place);
  }

  // The cursor over the settings of the whole host is on no node if none can be selected.
  bool walksSettingsOfTheHost() const {
    for (const char* name : {"ZORVA_DNSGeneralSettingData", "ZORVA_DNSGeneralElementSettingData",
                             "ZORVA_DNSGenEndPointElementSettingData", "ZORVA_DNSGenOrderedComponent"}) {
      if (std::string_view(name) == provider().className) return true;
    }
    return false;
  }

  std::vector<Fate> fatesOf(const Request& request) {
    usual(request);
    const TreeCalls calls;
    const Usual asUsual = usual(request);
    std::vector<Fate> fates;
    for (std::size_t n = 0; n < calls.all().size(); ++n) {
      const bool selects = calls.all()[n].call == TreeCall::SelectByType;
      fates.push_back(isHeldBack(calls.all(), n, asUsual.ending.outcome.lines) ? Fate::CaughtIfStd
                      : selects && walksSettingsOfTheHost()                    ? Fate::CaughtAlways
                                                                               : Fate::Flies);
    }
    return fates;
  }

  static void expectFlown(const Ending& ending, Thrown thrown) {
    EXPECT_EQ(thrown == Thrown::Int ? Ending::Flown::Other : Ending::Flown::Failure, ending.flown) << ending;
    if (thrown == Thrown::StdException) {
      EXPECT_EQ("the tree failed as it was asked to", ending.what);
    }
  }

  // There is no first setting of the host to be paired: reported by an exception of the library's own.
  bool lacksSettings(const Ending& ending) const {
    return std::string_view("ZORVA_DNSGenOrderedComponent") == provider().className &&
           ending.what.find("_M_range_check") != std::string::npos;
  }

  void expectFate(Fate fate, Thrown thrown, const Request& request, const Ending& ending, const Usual& asUsual) const {
    if (fate == Fate::Flies || (fate == Fate::CaughtIfStd && thrown == Thrown::Int)) {
      expectFlown(ending, thrown);
      return;
    }
    if (!lacksSettings(ending)) {
      EXPECT_TRUE(ending.returned()) << ending;
    }
    const bool isEndpointChange = fate == Fate::CaughtIfStd && request.kind == Kind::Modify;
    const char* told = isEndpointChange            ? "Caught Exception : "
                       : fate == Fate::CaughtIfStd ? "Caught Exception"
                                                   : "Select Node for NetworkIPConfig failed";
    EXPECT_THAT(ending.outcome.errors(), ::testing::Contains(told));
    const bool asksForNoKey = request.name == "GetInstance of a name without keys";  // which the broker reports
    EXPECT_THAT(ending.outcome.rc,
                ::testing::AnyOf(isEndpointChange ? CMPI_RC_ERR_FAILED : CMPI_RC_OK,
                                 asksForNoKey ? CMPI_RC_ERR_NOT_FOUND : CMPI_RC_OK, asUsual.ending.outcome.rc));
  }
};

TEST_P(TreeFaults, PassOnOrAreCaughtAsListed) {
  std::size_t tried = 0;
  for (const Request& request : requests()) {
    const std::vector<Fate> fates = fatesOf(request);
    for (const Thrown thrown : {Thrown::StdException, Thrown::Int}) {
      SCOPED_TRACE(request.name + (thrown == Thrown::Int ? ", no std::exception" : ", std::exception"));
      const std::size_t calls = failEachCall(
          request,
          [&](std::size_t n, const std::function<void()>& run) {
            const FailingTree failing(n, thrown);
            run();
            return failing.hasThrown();
          },
          [&](std::size_t n, const Ending& ending, const Usual& asUsual) {
            expectFate(fates.at(n - 1), thrown, request, ending, asUsual);
            expectKnownFiles(request, asUsual);
          });
      EXPECT_EQ(fates.size(), calls);
      tried += calls;
    }
  }
  report("tree", tried);
}

ZV_ON_ALL_HOSTS(TreeFaults);

}  // namespace
}  // namespace ZV::Test
