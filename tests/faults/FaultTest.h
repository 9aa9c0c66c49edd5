// What the tests that make something fail have in common: one provider on one host, its requests, and what must hold
// after each failure.
#pragma once

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
#include "RecordingLogger.h"
#include "Requests.h"

namespace ZV::Test {

// How a request ended: with an outcome, or with what flew out of it.
struct Ending {
  enum class Flown { Nothing, Failure, Other };  // a std::exception; anything else

  Flown flown = Flown::Nothing;
  std::string what;  // of the std::exception
  Outcome outcome;   // where nothing flew; else only its lines and calls
  bool returned() const { return flown == Flown::Nothing; }
};

// Whether two endings are alike in everything that a client, the broker or a reader of the log would see.
bool isSame(const Ending& left, const Ending& right);
std::ostream& operator<<(std::ostream& out, const Ending& ending);

// How many failures were tried of a kind ("broker"), told when the program ends.
void countFaults(const std::string& kind, std::size_t tried);

class FaultTest : public ::testing::TestWithParam<std::tuple<Tree, std::size_t>> {
 protected:
  // A request and how it ends where nothing fails.
  struct Usual {
    Ending ending;
    std::map<std::string, std::string> files;  // as a modification leaves them
  };

  FaultTest();

  const Provider& provider() const { return allProviders().at(std::get<1>(GetParam())); }
  Tree tree() const { return std::get<0>(GetParam()); }
  std::vector<Request> requests() const { return requestsOf(provider()); }

  // Makes the request and takes whatever flies out of it. What the provider made is freed.
  Ending run(const Request& request);
  // The same from the host as it was at first.
  Usual usual(const Request& request);

  // Makes the request with something failing at its 1st call, its 2nd, and so on. fail starts and ends that failure
  // about the run and says whether it was reached; check judges how the request ended; and then the host is as it was
  // but for what check allows, and the request without failures ends as ever, with no memory or file left behind.
  // Returns the number of failures. isNew may pass over calls that would fail as they did before.
  using Fail = std::function<bool(std::size_t n, const std::function<void()>& run)>;
  using IsNew = std::function<bool(const RecordedCall& call)>;
  using Check = std::function<void(std::size_t n, const Ending& ending, const Usual& usual)>;
  std::size_t failEachCall(const Request& request, const Fail& fail, const Check& check, const IsNew& isNew = {});

  // Of every ending: nothing is handed out behind returnDone, which comes once at most; nothing is released; the entry
  // is marked; there are no more results than usual; and no exception of the library's own flies but the one that is
  // told of one class: a host without settings of its own has no first one to pair with an assignment.
  void expectWellFormed(const Ending& ending, const Usual& usual) const;

  // A modification left each line of each file either as it was, or as it usually makes it, or with the text that could
  // not be read left out of it; and nothing else anywhere. A read left everything.
  void expectKnownFiles(const Request& request, const Usual& usual) const;

  void report(const char* kind, std::size_t tried) const;

  RecordingLogger logger_;
  Host host_;
  RecordingBroker broker_;

 private:
  std::size_t mostResults(const char* call, const Usual& usual) const;
  void expectAsEver(const Request& request, const Usual& usual, long blocks, std::size_t files);
};

// Three trees and twelve providers: ThreeInterfaces_DNSClientProvider and so on.
std::string nameOfFaultTest(const ::testing::TestParamInfo<std::tuple<Tree, std::size_t>>& info);
#define ZV_ON_ALL_HOSTS(test)                                                                                        \
  INSTANTIATE_TEST_SUITE_P(Hosts, test,                                                                              \
                           ::testing::Combine(::testing::ValuesIn(kAllTrees), ::testing::Range<std::size_t>(0, 12)), \
                           nameOfFaultTest)

}  // namespace ZV::Test
