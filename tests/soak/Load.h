#pragma once

// Clients that request everything that the twelve providers do from a broker, and check every response.

#include <array>
#include <atomic>
#include <cstddef>
#include <random>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "broker/Broker.h"

namespace ZV::Test {

/// The texts that clients write. Readers must find one of these as a whole, or the text from before.
inline constexpr const char* kWrittenNames[] = {"alpha.example.org", "bravo.example.org", "gamma.example.org"};

/// The shared data of the clients of one load. All except the counters is set before they start.
struct Load {
  Load(zorva::broker::Broker& asked, std::set<std::string> first) : broker(asked), namesAtFirst(std::move(first)) {}

  zorva::broker::Broker& broker;
  std::set<std::string> namesAtFirst;  ///< domain and host names of the host before the first write

  std::atomic<std::size_t> reads = 0;
  std::atomic<std::size_t> traversals = 0;  ///< of associations
  std::atomic<std::size_t> changes = 0;
  std::atomic<std::size_t> methods = 0;
  std::atomic<std::size_t> objects = 0;  ///< received objects
  std::atomic<std::size_t> problems =
      0;  ///< responses that are not well-formed, each reported as a failure of the test
};

/// One client; belongs to one thread.
class Client {
 public:
  Client(Load& load, unsigned int seed);

  /// Makes one random request and checks its response.
  void request();

  /// The objects of a class, which are checked.
  std::vector<zorva::broker::ObjectPath> names(const char* className);

 private:
  void read();
  void readOne();
  void traverse();
  void change();
  void invoke();

  template <typename Number>
  Number chance(Number count);
  std::string writtenName();
  /// A recent object of one of the classes; no class if none is known.
  zorva::broker::ObjectPath anyObject();

  /// The sinks of requests: they check and remember their arguments.
  zorva::broker::InstanceSink instances();
  zorva::broker::PathSink paths();
  void checkPath(const zorva::broker::ObjectPath& path);
  void checkTexts(const zorva::broker::Instance& instance);
  /// codes: the other right codes besides 0.
  void checkStatus(const zorva::broker::Status& status, const std::string& request, std::initializer_list<int> codes);
  void complain(const std::string& what);

  Load& load_;
  std::mt19937 random_;
  std::vector<zorva::broker::ObjectPath> known_;
};

}  // namespace ZV::Test
