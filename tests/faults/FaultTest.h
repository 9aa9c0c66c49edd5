#pragma once

// Shared by the tests that make something fail: one provider on one host, its requests, and what must be true after
// each failure.

#include <gmock/gmock.h>

#include <cstddef>
#include <exception>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include "Host.h"
#include "LiveMemory.h"
#include "Requests.h"
#include "tests/support/RecordingLogger.h"

namespace ZV::Test {

/// How a request ended: with an outcome, or with an exception.
struct Ending {
  enum class Flown { Nothing, Failure, Other };  ///< a std::exception; anything else

  Flown flown = Flown::Nothing;
  std::string what;  ///< of the std::exception
  Outcome outcome;   ///< if nothing was thrown; else only its lines and calls
  bool returned() const { return flown == Flown::Nothing; }
};

/// Whether a client, the broker or a reader of the log would see no difference between two endings.
bool isSame(const Ending& left, const Ending& right);
std::ostream& operator<<(std::ostream& out, const Ending& ending);

/// Counts the tried failures of a kind ("broker"). The sums are printed when the program ends.
void countFaults(const std::string& kind, std::size_t tried);

class FaultTest : public ::testing::TestWithParam<std::tuple<Tree, std::size_t>> {
 protected:
  /// A request and its end without failures.
  struct Usual {
    Ending ending;
    std::map<std::string, std::string> files;  ///< as a modification leaves them
  };

  FaultTest();

  const Provider& provider() const { return allProviders().at(std::get<1>(GetParam())); }
  Tree tree() const { return std::get<0>(GetParam()); }
  std::vector<Request> requests() const { return requestsOf(provider()); }

  /// Runs the request and catches its exceptions. All objects that the provider made are freed.
  Ending run(const Request& request);
  /// The same on the host in its first state.
  Usual usual(const Request& request);

  /// Runs the request with a failure at its 1st call, its 2nd, and so on. fail starts and ends the failure and says
  /// whether it was reached; check examines how the request ended. Then the host must be unchanged except for what
  /// check allows, and the request without failures must end as usual, with no memory or file left open. Returns the
  /// number of failures. isNew may skip calls that would fail as they did before.
  using Fail = std::function<bool(std::size_t n, const std::function<void()>& run)>;
  using IsNew = std::function<bool(const RecordedCall& call)>;
  using Check = std::function<void(std::size_t n, const Ending& ending, const Usual& usual)>;
  std::size_t failEachCall(const Request& request, const Fail& fail, const Check& check, const IsNew& isNew = {});

  /// True of every ending: nothing is returned after returnDone, which is called at most once; nothing is released; the
  /// entry is logged; there are no more results than usual. The library throws no exception of its own, except in one
  /// class: a host without settings has no first setting to pair with an assignment.
  void expectWellFormed(const Ending& ending, const Usual& usual) const;

  /// After a modification each line of each file is either unchanged, or as usual, or as usual without the text that
  /// could not be read; nothing else changes. A read changes nothing.
  void expectKnownFiles(const Request& request, const Usual& usual) const;

  void report(const char* kind, std::size_t tried) const;

  RecordingLogger logger_;
  Host host_;
  RecordingBroker broker_;

 private:
  std::size_t mostResults(const char* call, const Usual& usual) const;
  void expectAsEver(const Request& request, const Usual& usual, long blocks, std::size_t files);
};

/// Three trees and twelve providers: ThreeInterfaces_DNSClientProvider and so on.
std::string nameOfFaultTest(const ::testing::TestParamInfo<std::tuple<Tree, std::size_t>>& info);
#define ZV_ON_ALL_HOSTS(test)                                                                                        \
  INSTANTIATE_TEST_SUITE_P(Hosts, test,                                                                              \
                           ::testing::Combine(::testing::ValuesIn(kAllTrees), ::testing::Range<std::size_t>(0, 12)), \
                           nameOfFaultTest)

}  // namespace ZV::Test
