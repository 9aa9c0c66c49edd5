#include "agent/sources/BmcSource.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <map>
#include <set>
#include <stdexcept>
#include <utility>
#include <vector>

#include "agent/config/Config.h"
#include "agent/log/LogOutput.h"

namespace zorva::agent {

namespace {

using namespace ZV::NodeLexicon;

constexpr PropertyNumber kNothing = 0;

// Of all interfaces below that node.
std::set<std::string> interfaceNames(const TreeSnapshot& tree, const Node& top) {
  std::set<std::string> names;
  for (const Node* child : tree.children(top)) {
    const std::string* name = child->text(PROP_NAME);
    if (name != nullptr) names.insert(*name);
    names.merge(interfaceNames(tree, *child));
  }
  return names;
}

// Adds a child of the root with all below it, without the property of that number. Returns its index.
std::size_t copy(TreeBuilder& builder, const TreeSnapshot& tree, const Node& top, PropertyNumber leftOut) {
  std::map<std::size_t, std::size_t> placed{{top.parentIndex(), 0}};
  for (std::size_t i = top.index(); i < tree.nodes().size(); ++i) {
    const Node& node = tree.nodes()[i];
    if (i != top.index() && node.parentIndex() < top.index()) break;
    const std::size_t place = builder.add(placed[node.parentIndex()], node.type(), node.name(), node.description());
    placed[i] = place;
    for (const Property& property : node.properties()) {
      if (property.number != leftOut) builder.set(place, property.number, property.value, property.overlaid);
    }
  }
  return placed[top.index()];
}

}  // namespace

BmcSource::BmcSource(std::shared_ptr<TreeSource> host, std::string file, Clock clock, int comparisons)
    : host_(std::move(host)),
      file_(std::move(file)),
      clock_(std::move(clock)),
      comparisons_(comparisons),
      watch_(comparisons) {}

bool BmcSource::changed() {
  // Both are asked every time, so that no events pile up in either.
  if (host_->changed()) hostChanged_ = true;
  if (watch_.changed()) fileChanged_ = true;
  return hostChanged_ || fileChanged_ || isUnknown() != unknown_;
}

void BmcSource::reopen() {
  host_->reopen();
  watch_ = FileWatch(comparisons_);
  hostChanged_ = true;
  fileChanged_ = true;
}

void BmcSource::addWakers(Wakers& wakers) {
  host_->addWakers(wakers);
  wakers.addOrLook(watch_.descriptor());
  if (state_.tree == nullptr || unknown_) return;
  // What was read counts as unknown from then on, and nothing else reports that.
  const auto end = std::chrono::seconds(state_.readAt + kBmcIntervals * state_.interval + 1);
  const auto left = end - clock_().time_since_epoch();
  wakers.addDeadline(std::clamp(std::chrono::ceil<std::chrono::milliseconds>(left), std::chrono::milliseconds(0),
                                std::chrono::milliseconds(std::chrono::hours(1))));
}

bool BmcSource::isUnknown() const {
  if (state_.tree == nullptr) return false;
  const auto now = std::chrono::duration_cast<std::chrono::seconds>(clock_().time_since_epoch()).count();
  return state_.isUnknownAt(now < 0 ? 0 : static_cast<std::uint64_t>(now));
}

std::shared_ptr<const TreeSnapshot> BmcSource::read() {
  if (hostChanged_ || hostTree_ == nullptr) {
    hostTree_ = nullptr;
    hostTree_ = host_->read();
    hostChanged_ = false;
  }
  if (fileChanged_) {
    watch_.watch({file_});
    readState();
    fileChanged_ = false;
  }
  unknown_ = isUnknown();
  return merged();
}

void BmcSource::readState() {
  state_ = {};
  if (::access(file_.c_str(), F_OK) != 0 && (errno == ENOENT || errno == ENOTDIR)) {
    reported_.clear();
    return;
  }
  try {
    state_ = readBmcState(file_);
    reported_.clear();
  } catch (const std::exception& error) {
    if (reported_ == error.what()) return;
    reported_ = error.what();
    ZORVAGENT_LOG_ERROR("the service processor is left out: " + reported_);
  }
}

// The providers keep the last endpoint of a name, and the order of the first list that names a server. So service
// processors come after the host, but for one that has an interface of the same name: it must not hide the host's.
std::shared_ptr<const TreeSnapshot> BmcSource::merged() const {
  if (state_.tree == nullptr || state_.tree->nodes().size() <= 1) return hostTree_;
  const std::set<std::string> names = interfaceNames(*hostTree_, hostTree_->root());
  std::vector<const Node*> before;
  std::vector<const Node*> after;
  for (const Node* system : state_.tree->children(state_.tree->root())) {
    const std::set<std::string> own = interfaceNames(*state_.tree, *system);
    const bool collides =
        std::any_of(own.begin(), own.end(), [&](const std::string& name) { return names.contains(name); });
    (collides ? before : after).push_back(system);
  }
  try {
    if (before.empty()) {
      TreeBuilder builder(*hostTree_);
      for (const Node* system : after) addSystem(builder, *system);
      return builder.finish();
    }
    TreeBuilder builder(hostTree_->systemName());
    for (const Node* system : before) addSystem(builder, *system);
    for (const Node* system : hostTree_->children(hostTree_->root())) copy(builder, *hostTree_, *system, kNothing);
    for (const Node* system : after) addSystem(builder, *system);
    return builder.finish();
  } catch (const std::invalid_argument& error) {
    ZORVAGENT_LOG_ERROR(std::string("the service processor is left out: ") + error.what());
    return hostTree_;
  }
}

void BmcSource::addSystem(TreeBuilder& builder, const Node& system) const {
  const std::size_t place = copy(builder, *state_.tree, system, unknown_ ? PROP_ENABLED_STATE : kNothing);
  builder.set(place, kReadAt, static_cast<unsigned int>(state_.readAt));
  builder.set(place, kReadInterval, static_cast<unsigned int>(state_.interval));
  if (!state_.problem.empty()) builder.set(place, kReadProblem, state_.problem);
}

}  // namespace zorva::agent
