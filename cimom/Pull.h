#pragma once

// Enumerations that clients pull in pieces (DSP0200 5.3.2.24). The objects are collected when the enumeration is opened
// and are kept as the text of the responses. So a client sees one state of the system, and a slow client does not keep
// a provider busy. The number of enumerations and their bytes are limited. An enumeration that its client does not
// continue is dropped after its timeout.
//
// If there is no room, the enumeration that has waited longest for its client is dropped, so that no client is locked
// out: one of the same client if it has as many as a client may have, else one of the client that has most. An
// enumeration that fits its first response is never kept and needs no room.
//
// Any number of threads may use one PullTable at once.

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "broker/objects/Value.h"
#include "util/NotCopied.h"

namespace zorva::cimom {

/// The status codes of pulled enumerations that CMPI has no name for (DSP0200 5.2.4).
enum PullStatus : int {
  kInvalidEnumerationContext = 21,
  kInvalidOperationTimeout = 22,
  kFilteredEnumerationNotSupported = 25,
  kContinuationOnErrorNotSupported = 26,
  kServerLimitsExceeded = 27,
};

struct PullLimits {
  std::chrono::seconds defaultTimeout{60};
  std::chrono::seconds maxTimeout{600};
  std::size_t maxOpen = 100;  ///< of all clients; 0: none is kept
  std::size_t maxOpenOfClient = 25;
  std::size_t maxEmptyPulls = 10;     ///< pulls of zero objects one after another, each of which renews the timeout
  std::size_t maxObjects = 10'000;    ///< the most that one pull may request
  std::size_t maxBytes = 64U << 20U;  ///< of text, in all enumerations together
};

/// The form of an enumeration's results.
enum class PullForm { Instances, Paths };

class PullTable;

/// Objects of one enumeration, in order, and their share of the table's bytes, which the destructor gives back. If all
/// bytes are taken, enumerations of clients that hold more than this one are dropped.
class PullObjects : util::NotCopied {
 public:
  explicit PullObjects(PullTable& table) noexcept : table_(table) {}
  ~PullObjects();

  /// False, with nothing added, if the table has no room left.
  bool add(std::string_view text);
  std::size_t size() const noexcept { return texts_.size(); }
  std::size_t bytes() const noexcept { return bytes_; }
  const std::deque<std::string>& texts() const noexcept { return texts_; }
  /// Moves the first `count` of them, or all, to `taken`.
  void moveTo(PullObjects& taken, std::size_t count);

 private:
  PullTable& table_;
  std::deque<std::string> texts_;
  std::size_t bytes_ = 0;
};

class PullTable : util::NotCopied {
 public:
  using Clock = std::chrono::steady_clock;

  explicit PullTable(PullLimits limits) : limits_(limits) {}

  const PullLimits& limits() const noexcept { return limits_; }

  /// Keeps the rest of an enumeration of `client`; others may be dropped for it. `context` gets the name by which it is
  /// found again. CIM_ERR_SERVER_LIMITS_EXCEEDED if none may be kept.
  broker::Status keep(const std::string& client, PullForm form, std::string_view nameSpace, PullObjects& rest,
                      std::chrono::seconds timeout, std::string& context, Clock::time_point now = Clock::now());

  /// Moves up to `count` objects to `taken`. `ended`: none are left, and the context is gone. The timeout starts again.
  /// CIM_ERR_INVALID_ENUMERATION_CONTEXT if there is no such context, in this namespace and of this form;
  /// CIM_ERR_SERVER_LIMITS_EXCEEDED, without a new timeout, if `count` has been 0 too often.
  broker::Status take(const std::string& context, std::string_view nameSpace, PullForm form, std::size_t count,
                      PullObjects& taken, bool& ended, Clock::time_point now = Clock::now());

  broker::Status close(const std::string& context, std::string_view nameSpace, Clock::time_point now = Clock::now());

  /// How many objects are left.
  broker::Status count(const std::string& context, std::string_view nameSpace, std::uint64_t& left,
                       Clock::time_point now = Clock::now());

  /// Drops enumerations whose clients did not continue them in time. The functions above do so too.
  void reclaim(Clock::time_point now = Clock::now());

  std::size_t bytes() const noexcept { return bytes_.load(); }

 private:
  friend class PullObjects;

  struct Open {
    explicit Open(PullTable& table) : objects(table) {}
    std::string client;
    PullForm form = PullForm::Instances;
    std::string nameSpace;
    PullObjects objects;
    std::chrono::seconds timeout{};
    Clock::time_point deadline;
    Clock::time_point waitsSince;  ///< the client last got objects
    std::size_t emptyPulls = 0;    ///< since then
  };
  using Map = std::map<std::string, Open, std::less<>>;
  using Weight = std::size_t (*)(const Open&);

  void dropOld(Clock::time_point now);
  bool takeBytes(std::size_t size, std::size_t held);
  void makeRoomFor(const std::string& client);
  Map::iterator nextToGiveWay(Weight weightOf, std::size_t& weight);
  template <typename Predicate>
  Map::iterator longestWaiting(Predicate&& isMeant);
  broker::Status find(const std::string& context, std::string_view nameSpace, Map::iterator& found);

  const PullLimits limits_;
  std::atomic<std::size_t> bytes_ = 0;
  mutable std::mutex mutex_;
  Map open_;  ///< guarded by mutex_
};

}  // namespace zorva::cimom
