#include "agent/TreeWatch.h"

#include <algorithm>
#include <utility>

#include "agent/Runtime.h"
#include "agent/config/CurrentConfig.h"
#include "agent/tree/Overlay.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

constexpr int kNoComparisons = 0;
// The kernel reports one change of an interface in several messages.
constexpr milliseconds kBetweenReadings{50};

int asTimeout(std::optional<milliseconds> time) {
  if (!time.has_value()) return -1;
  return static_cast<int>(std::clamp(*time, milliseconds(0), milliseconds(std::chrono::hours(24))).count());
}

const Config& checkedConfig() {
  CurrentConfig::instance().check();
  return CurrentConfig::instance().get();
}

}  // namespace

struct TreeWatch::State {
  explicit State(const Config& config)
      : source(makeSource(config, kNoComparisons)), overlay(config.dataDir, kNoComparisons) {}

  std::shared_ptr<TreeSource> source;
  OverlayReader overlay;
  std::shared_ptr<const TreeSnapshot> sourceTree;
  std::shared_ptr<const TreeSnapshot> latest;  ///< null: must be read again
  Clock::time_point readAt;
};

TreeWatch::TreeWatch() : state_(std::make_unique<State>(checkedConfig())) {}

TreeWatch::~TreeWatch() = default;

std::shared_ptr<const TreeSnapshot> TreeWatch::tree() {
  State& state = *state_;
  const bool sourceChanged = state.source->changed();
  const bool overlayChanged = state.overlay.changed();
  if (sourceChanged) state.sourceTree = nullptr;
  if (!sourceChanged && !overlayChanged && state.latest != nullptr) return state.latest;
  state.latest = nullptr;
  state.readAt = Clock::now();
  if (state.sourceTree == nullptr) state.sourceTree = state.source->read();
  if (overlayChanged) state.overlay.read();
  state.latest = state.overlay.applyTo(state.sourceTree);
  return state.latest;
}

void TreeWatch::wait(std::vector<pollfd>& others, std::optional<milliseconds> longest) {
  State& state = *state_;
  const auto calm = std::chrono::ceil<milliseconds>(state.readAt + kBetweenReadings - Clock::now());
  if (calm.count() > 0 && ::poll(others.data(), others.size(), asTimeout(calm)) > 0) return;
  Wakers wakers;
  // A source that could not be read has nothing yet that reports a change.
  if (state.latest != nullptr) {
    state.source->addWakers(wakers);
  } else {
    wakers.addDeadline(kLooksForTheUnreported);
  }
  wakers.addOrLook(state.overlay.descriptor());
  if (longest.has_value()) wakers.addDeadline(*longest);
  std::vector<pollfd> all = others;
  all.insert(all.end(), wakers.descriptors.begin(), wakers.descriptors.end());
  if (::poll(all.data(), all.size(), asTimeout(wakers.deadline)) <= 0) return;
  std::copy_n(all.begin(), others.size(), others.begin());
}

}  // namespace zorva::agent
