#include "agent/sources/BmcSource.h"

#include <unistd.h>

#include <cerrno>
#include <utility>
#include <vector>

#include "agent/config/Config.h"
#include "agent/log/LogOutput.h"

namespace zorva::agent {

using namespace ZV::NodeLexicon;

BmcSource::BmcSource(std::shared_ptr<TreeSource> host, std::string file, Clock clock)
    : host_(std::move(host)), file_(std::move(file)), clock_(std::move(clock)) {}

bool BmcSource::changed() {
  // Both are asked every time, so that no events pile up in either.
  if (host_->changed()) hostChanged_ = true;
  if (watch_.changed()) fileChanged_ = true;
  return hostChanged_ || fileChanged_ || isUnknown() != unknown_;
}

void BmcSource::reopen() {
  host_->reopen();
  watch_ = FileWatch();
  hostChanged_ = true;
  fileChanged_ = true;
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

std::shared_ptr<const TreeSnapshot> BmcSource::merged() const {
  if (state_.tree == nullptr || state_.tree->nodes().size() <= 1) return hostTree_;
  TreeBuilder builder(*hostTree_);
  std::vector<std::size_t> placed{0};
  for (const Node& node : state_.tree->nodes()) {
    if (node.type() == NodeType::Root) continue;
    placed.push_back(builder.add(placed[node.parentIndex()], node.type(), node.name(), node.description()));
    for (const Property& property : node.properties()) {
      if (unknown_ && property.number == PROP_ENABLED_STATE) continue;
      builder.set(placed.back(), property.number, property.value);
    }
    if (node.type() != NodeType::System) continue;
    builder.set(placed.back(), kReadAt, static_cast<unsigned int>(state_.readAt));
    builder.set(placed.back(), kReadInterval, static_cast<unsigned int>(state_.interval));
    if (!state_.problem.empty()) builder.set(placed.back(), kReadProblem, state_.problem);
  }
  try {
    return builder.finish();
  } catch (const std::invalid_argument& error) {
    ZORVAGENT_LOG_ERROR(std::string("the service processor is left out: ") + error.what());
    return hostTree_;
  }
}

}  // namespace zorva::agent
