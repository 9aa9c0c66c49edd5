#include "server/Pull.h"

#include <sys/random.h>

#include <utility>

#include "schema/Schema.h"

namespace zorva::server {

namespace {

// What a text takes beside its bytes.
constexpr std::size_t kOverhead = 64;

/// A name that nobody can guess: who has it may go on with the enumeration.
std::string newContext() {
  unsigned char bytes[16];
  std::size_t filled = 0;
  while (filled < sizeof bytes) {
    const ssize_t got = getrandom(bytes + filled, sizeof bytes - filled, 0);
    if (got > 0) filled += static_cast<std::size_t>(got);
  }
  std::string name;
  for (const unsigned char byte : bytes) {
    name += "0123456789abcdef"[byte >> 4U];
    name += "0123456789abcdef"[byte & 15U];
  }
  return name;
}

}  // namespace

PullObjects::~PullObjects() { table_.bytes_ -= bytes_; }

bool PullObjects::add(std::string_view text) {
  const std::size_t size = text.size() + kOverhead;
  if (table_.bytes_.fetch_add(size) + size > table_.limits_.maxBytes) {
    table_.bytes_ -= size;
    return false;
  }
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

broker::Status PullTable::room(Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  dropOld(now);
  if (open_.size() < limits_.maxOpen) return {};
  return {kServerLimitsExceeded, std::to_string(open_.size()) +
                                     " enumerations are open, and no more are allowed; close one, or try again later"};
}

broker::Status PullTable::keep(PullForm form, std::string_view nameSpace, PullObjects& rest,
                               std::chrono::seconds timeout, std::string& context, Clock::time_point now) {
  broker::Status status = room(now);
  if (!status.ok()) return status;
  context = newContext();
  const std::lock_guard lock(mutex_);
  Open& open = open_.try_emplace(context, *this).first->second;
  open.form = form;
  open.nameSpace = nameSpace;
  rest.moveTo(open.objects, rest.size());
  open.timeout = timeout;
  open.deadline = now + timeout;
  return {};
}

broker::Status PullTable::find(const std::string& context, std::string_view nameSpace, Map::iterator& found) {
  found = open_.find(context);
  if (found != open_.end() && schema::sameNamespace(found->second.nameSpace, nameSpace)) return {};
  return {kInvalidEnumerationContext,
          "there is no such open enumeration in " + std::string(nameSpace) +
              ": it has ended, was closed, or was left alone for longer than its OperationTimeout"};
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

std::size_t PullTable::openCount() const {
  const std::lock_guard lock(mutex_);
  return open_.size();
}

void PullTable::dropOld(Clock::time_point now) {
  std::erase_if(open_, [now](const auto& entry) { return entry.second.deadline <= now; });
}

}  // namespace zorva::server
