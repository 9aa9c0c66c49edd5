#include "agent/Runtime.h"

#include <pthread.h>
#include <unistd.h>

#include <chrono>
#include <stdexcept>
#include <utility>

#include "agent/Seams.h"
#include "agent/apply/Apply.h"
#include "agent/config/CurrentConfig.h"
#include "agent/log/LogOutput.h"
#include "agent/sources/BmcSource.h"
#include "agent/sources/FileSource.h"
#include "agent/sources/HostSource.h"
#include "util/HostName.h"

namespace zorva::agent {
namespace {

std::shared_ptr<TreeSource> makeSourceOfHost(const Config& config, int comparisons) {
  if (config.source == "file") return std::make_shared<FileSource>(config.treeFile, comparisons);
  HostSourceOptions options;
  options.comparisons = comparisons;
  options.includeLoopback = config.includeLoopback;
  return std::make_shared<HostSource>(options);
}

}  // namespace

std::shared_ptr<TreeSource> makeSource(const Config& config, int comparisons) {
  std::shared_ptr<TreeSource> host = makeSourceOfHost(config, comparisons);
  if (config.bmc.file.empty()) return host;
  return std::make_shared<BmcSource>(std::move(host), config.bmc.file, std::chrono::system_clock::now, comparisons);
}

Runtime& Runtime::instance() {
  static Runtime runtime;
  return runtime;
}

void Runtime::askForExceptions() {
  throws_ = true;
  neverTellSyslog();
}

// The log registers before, so that its lock is taken after these over a fork, as elsewhere.
Runtime::Runtime() : process_(::getpid()) {
  watchForksOfLog();
  ::pthread_atfork([] { instance().holdStill(); }, [] { instance().goOn(); }, [] { instance().goOn(); });
}

void Runtime::holdStill() {
  lookMutex_.lock();
  latestMutex_.lock();
}

void Runtime::goOn() {
  latestMutex_.unlock();
  lookMutex_.unlock();
}

void Runtime::useConfig(const Config& config) {
  const std::lock_guard look(lookMutex_);
  CurrentConfig::instance().use(config);
  if (!sourceIsGiven_) source_ = nullptr;
  forgetTree();
}

std::shared_ptr<const TreeSnapshot> Runtime::look() {
  const std::lock_guard lock(lookMutex_);
  try {
    return lookAndRead();
  } catch (const std::exception& error) {
    ZORVAGENT_LOG_ERROR(std::string("the tree cannot be read: ") + error.what());
    throw;
  }
}

std::shared_ptr<const TreeSnapshot> Runtime::lookAtSource() {
  const std::lock_guard lock(lookMutex_);
  lookAndRead();
  return sourceTree_;
}

std::shared_ptr<const TreeSnapshot> Runtime::lookAndRead() {
  CurrentConfig::instance().check();
  if (process_ != ::getpid()) followFork();
  const Config& config = CurrentConfig::instance().get();
  if (source_ == nullptr) source_ = makeSource(config);
  if (!overlay_.has_value()) overlay_.emplace(config.dataDir);

  // Both are asked every time, so that no events pile up in either.
  const bool sourceChanged = source_->changed();
  const bool overlayChanged = overlay_->changed();
  if (sourceChanged) sourceTree_ = nullptr;
  if (overlayChanged) overlayStale_ = true;
  if (sourceTree_ == nullptr || overlayStale_) latestStale_ = true;
  if (!latestStale_) return latest_;

  if (sourceTree_ == nullptr) sourceTree_ = source_->read();
  if (overlayStale_) overlay_->read();
  overlayStale_ = false;
  auto tree = overlay_->applyTo(sourceTree_);
  const std::lock_guard lock(latestMutex_);
  latest_ = std::move(tree);
  latestStale_ = false;
  return latest_;
}

// Descriptors that were opened before the fork belong to the parent: events that are read here would be missing there.
void Runtime::followFork() {
  process_ = ::getpid();
  overlay_.reset();
  overlayStale_ = true;
  sourceTree_ = nullptr;
  if (source_ != nullptr) source_->reopen();
}

std::shared_ptr<const TreeSnapshot> Runtime::latest() {
  {
    const std::lock_guard lock(latestMutex_);
    if (latest_ != nullptr) return latest_;
  }
  return look();
}

std::shared_ptr<const TreeSnapshot> Runtime::lookForCursor() {
  if (throws_) return look();
  const std::lock_guard lock(lookMutex_);
  try {
    auto tree = lookAndRead();
    reported_.clear();
    return tree;
  } catch (const std::exception& error) {
    reportOnce(std::string("the tree cannot be read: ") + error.what());
  } catch (...) {
    reportOnce("the tree cannot be read");
  }
  return nullptr;
}

// A server asks again with every request, so the same problem is reported once.
void Runtime::reportOnce(const std::string& problem) {
  // A server may fork the processes of its providers from one that has reported it.
  if (reportedIn_ != ::getpid()) {
    reportedIn_ = ::getpid();
    reported_.clear();
    syslogIsInformed_ = false;
  }
  if (problem == reported_) return;
  reported_ = problem;
  ZORVAGENT_LOG_ERROR(problem);
  if (syslogIsInformed_) return;
  syslogIsInformed_ = true;
  if (!errorsGoToSyslog()) tellSyslog(problem);
}

std::shared_ptr<const TreeSnapshot> Runtime::latestForCursor() {
  {
    const std::lock_guard lock(latestMutex_);
    if (latest_ != nullptr) return latest_;
  }
  return lookForCursor();
}

std::string Runtime::systemName() {
  CurrentConfig& current = CurrentConfig::instance();
  if (const std::string& name = current.get().systemName; !name.empty()) return name;
  if (current.isWrong()) return util::kernelHostName();
  try {
    // Of the tree in which the latest cursor was placed: the name is used many times in one operation and must not
    // change in between.
    const std::shared_ptr<const TreeSnapshot> tree = latestForCursor();
    return tree == nullptr || tree->systemName().empty() ? util::kernelHostName() : tree->systemName();
  } catch (...) {
    return util::kernelHostName();
  }
}

bool Runtime::store(const std::string& path, PropertyNumber property, const PropertyValue& value) try {
  if (!canBeSet(property, value)) {
    throw std::invalid_argument("property " + std::to_string(property) + " cannot be set to such a value");
  }
  const std::shared_ptr<const TreeSnapshot> source = lookAtSource();
  const Node* node = source->find(path);
  if (node == nullptr || node->type() != NodeType::NetworkIPConfig) {
    throw std::invalid_argument("no such node has an IP configuration");
  }
  // The source's own value needs no entry; from now on the source's changes are visible.
  const Property* own = node->find(property);
  const bool same = own != nullptr && equalValues(own->value, value);
  overlay().set(path, property, same ? std::nullopt : std::optional<PropertyValue>(value));
  overlayHasChanged();
  const std::string* interface = node->text(ZV::NodeLexicon::PROP_NAME);
  const bool isOfBmc = source->parent(source->parent(*node)).isServiceProcessor();
  return property == ZV::NodeLexicon::PROP_HOST_NAME || interface == nullptr ||
         reachesHost(isOfBmc ? path : *interface);
} catch (const std::exception& error) {
  ZORVAGENT_LOG_ERROR(path + ": the value is not stored: " + error.what());
  return false;
}

// A process without the rights leaves it to the service that has them.
bool Runtime::reachesHost(const std::string& interface) {
  if (!CurrentConfig::instance().get().appliesToHost || ::geteuid() != 0) return true;
  std::string problem;
  try {
    for (const ApplyResult& result : applySettings({interface})) problem = result.problem;
  } catch (const std::exception& error) {
    problem = error.what();
  }
  if (problem.empty()) return true;
  ZORVAGENT_LOG_ERROR(interface + ": the value is stored, but not applied to the host: " + problem);
  return false;
}

Overlay Runtime::overlay() {
  CurrentConfig::instance().check();
  return Overlay(CurrentConfig::instance().get().dataDir);
}

void Runtime::overlayHasChanged() {
  const std::lock_guard lock(lookMutex_);
  overlayStale_ = true;
}

void Runtime::setSource(std::shared_ptr<TreeSource> source) {
  const std::lock_guard lock(lookMutex_);
  sourceIsGiven_ = source != nullptr;
  source_ = std::move(source);
  forgetTree();
}

void Runtime::forgetTree() {
  overlay_.reset();
  overlayStale_ = true;
  sourceTree_ = nullptr;
  const std::lock_guard lock(latestMutex_);
  latest_ = nullptr;
}

void Runtime::reset() {
  const std::lock_guard lock(lookMutex_);
  throws_ = false;
  reported_.clear();
  reportedIn_ = 0;
  sourceIsGiven_ = false;
  source_ = nullptr;
  CurrentConfig::instance().forget();
  forgetTree();
}

void setTreeSource(std::shared_ptr<TreeSource> source) { Runtime::instance().setSource(std::move(source)); }

void setConfig(const Config& config) { Runtime::instance().useConfig(config); }

void reset() {
  setTreeCallHook(nullptr);
  resetLog();
  Runtime::instance().reset();
}

}  // namespace zorva::agent
