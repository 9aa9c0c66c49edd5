#include "cimom/Pull.h"

#include <sys/random.h>

#include <algorithm>
#include <utility>

#include "schema/Schema.h"
#include "util/Text.h"

namespace zorva::cimom {

namespace {

// The memory of a text besides its bytes.
constexpr std::size_t kOverhead = 64;

/// A name that cannot be guessed: any client that has it may continue the enumeration.
std::string newContext() {
  unsigned char bytes[16];
  std::size_t filled = 0;
  while (filled < sizeof bytes) {
    const ssize_t got = getrandom(bytes + filled, sizeof bytes - filled, 0);
    if (got > 0) filled += static_cast<std::size_t>(got);
  }
  return util::hexOf({reinterpret_cast<const char*>(bytes), sizeof bytes});
}

}  // namespace

PullObjects::~PullObjects() { table_.bytes_ -= bytes_; }

bool PullObjects::add(std::string_view text) {
  const std::size_t size = text.size() + kOverhead;
  if (!table_.takeBytes(size, bytes_)) return false;
  bytes_ += size;
  texts_.emplace_back(text);
  return true;
}

void PullObjects::moveTo(PullObjects& taken, std::size_t count) {
  for (; count > 0 && !texts_.empty(); --count) {
    const std::size_t size = texts_.front().size() + kOverhead;
    taken.texts_.push_back(std::move(texts_.front()));
    taken.bytes_ += size;
    bytes_ -= size;
    texts_.pop_front();
  }
}

/// Finds the client whose enumerations are largest together, and of these the one that has waited longest. `weight`
/// gets the size of all enumerations of that client. Returns the end if none is open.
PullTable::Map::iterator PullTable::nextToGiveWay(Weight weightOf, std::size_t& weight) {
  std::map<std::string_view, std::size_t> weights;
  for (const auto& [context, open] : open_) weights[open.client] += weightOf(open);
  weight = 0;
  for (const auto& [client, all] : weights) weight = std::max(weight, all);
  return longestWaiting([&](const Open& open) { return weights[open.client] == weight; });
}

template <typename Predicate>
PullTable::Map::iterator PullTable::longestWaiting(Predicate&& isMeant) {
  auto longest = open_.end();
  for (auto each = open_.begin(); each != open_.end(); ++each) {
    if (!isMeant(each->second)) continue;
    if (longest == open_.end() || each->second.waitsSince < longest->second.waitsSince) longest = each;
  }
  return longest;
}

/// Takes a share of the bytes for an enumeration that is being collected and holds `held`. Only the enumerations of
/// clients that hold more are dropped for it, so that one large enumeration does not end all others.
bool PullTable::takeBytes(std::size_t size, std::size_t held) {
  const auto fits = [&] {
    if (bytes_.fetch_add(size) + size <= limits_.maxBytes) return true;
    bytes_ -= size;
    return false;
  };
  if (fits()) return true;
  const std::lock_guard lock(mutex_);
  while (!fits()) {
    std::size_t most = 0;
    const auto next = nextToGiveWay([](const Open& open) { return open.objects.bytes(); }, most);
    if (next == open_.end() || most <= held) return false;
    open_.erase(next);
  }
  return true;
}

/// Makes room for one more enumeration of a client.
void PullTable::makeRoomFor(const std::string& client) {
  const auto isOwn = [&](const Open& open) { return open.client == client; };
  const auto own = std::count_if(open_.begin(), open_.end(), [&](const auto& entry) { return isOwn(entry.second); });
  std::size_t most = 0;
  if (static_cast<std::size_t>(own) >= limits_.maxOpenOfClient) {
    open_.erase(longestWaiting(isOwn));
  } else if (open_.size() >= limits_.maxOpen) {
    open_.erase(nextToGiveWay([](const Open&) { return std::size_t{1}; }, most));
  }
}

broker::Status PullTable::keep(const std::string& client, PullForm form, std::string_view nameSpace, PullObjects& rest,
                               std::chrono::seconds timeout, std::string& context, Clock::time_point now) {
  if (limits_.maxOpen == 0) {
    return {kServerLimitsExceeded,
            "no enumeration is kept here: ask for all objects at once, or enumerate without pulling"};
  }
  context = newContext();
  const std::lock_guard lock(mutex_);
  dropOld(now);
  makeRoomFor(client);
  Open& open = open_.try_emplace(context, *this).first->second;
  open.client = client;
  open.form = form;
  open.nameSpace = nameSpace;
  rest.moveTo(open.objects, rest.size());
  open.timeout = timeout;
  open.deadline = now + timeout;
  open.waitsSince = now;
  return {};
}

broker::Status PullTable::find(const std::string& context, std::string_view nameSpace, Map::iterator& found) {
  found = open_.find(context);
  if (found != open_.end() && schema::sameNamespace(found->second.nameSpace, nameSpace)) return {};
  return {kInvalidEnumerationContext,
          "there is no such open enumeration in " + std::string(nameSpace) +
              ": it has ended, was closed, was left alone for longer than its OperationTimeout, or gave way to others"};
}

broker::Status PullTable::take(const std::string& context, std::string_view nameSpace, PullForm form, std::size_t count,
                               PullObjects& taken, bool& ended, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  dropOld(now);
  Map::iterator found;
  broker::Status status = find(context, nameSpace, found);
  if (!status.ok()) return status;
  Open& open = found->second;
  if (open.form != form) {
    return {kInvalidEnumerationContext, form == PullForm::Instances
                                            ? "the enumeration gives paths: use PullInstancePaths"
                                            : "the enumeration gives instances: use "
                                              "PullInstancesWithPath"};
  }
  if (count == 0 && open.emptyPulls == limits_.maxEmptyPulls) {
    return {kServerLimitsExceeded,
            "more than " + std::to_string(limits_.maxEmptyPulls) +
                " pulls of zero objects, one after another; the OperationTimeout is not renewed"};
  }
  open.emptyPulls = count == 0 ? open.emptyPulls + 1 : 0;
  if (count > 0) open.waitsSince = now;
  open.objects.moveTo(taken, count);
  ended = open.objects.size() == 0;
  open.deadline = now + open.timeout;
  if (ended) open_.erase(found);
  return {};
}

broker::Status PullTable::close(const std::string& context, std::string_view nameSpace, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  dropOld(now);
  Map::iterator found;
  broker::Status status = find(context, nameSpace, found);
  if (status.ok()) open_.erase(found);
  return status;
}

broker::Status PullTable::count(const std::string& context, std::string_view nameSpace, std::uint64_t& left,
                                Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  dropOld(now);
  Map::iterator found;
  broker::Status status = find(context, nameSpace, found);
  if (status.ok()) left = found->second.objects.size();
  return status;
}

void PullTable::reclaim(Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  dropOld(now);
}

void PullTable::dropOld(Clock::time_point now) {
  std::erase_if(open_, [now](const auto& entry) { return entry.second.deadline <= now; });
}

}  // namespace zorva::cimom
