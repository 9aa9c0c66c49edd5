#include "agent/Runtime.h"

#include <pthread.h>
#include <syslog.h>
#include <unistd.h>

#include <stdexcept>
#include <utility>

#include "agent/Seams.h"
#include "agent/log/LogOutput.h"
#include "agent/sources/FileSource.h"
#include "agent/sources/HostSource.h"
#include "util/HostName.h"

namespace zorva::agent {
namespace {

std::shared_ptr<TreeSource> makeSource(const Config& config) {
  if (config.source == "file") return std::make_shared<FileSource>(config.treeFile);
  HostSourceOptions options;
  options.includeLoopback = config.includeLoopback;
  return std::make_shared<HostSource>(options);
}

}  // namespace

Runtime& Runtime::instance() {
  static Runtime runtime;
  return runtime;
}

Runtime::Runtime() : process_(::getpid()) {
  // A thread that is inside while another one forks would leave its locks held in the child for ever. The C library
  // forgets these when the library is unloaded.
  ::pthread_atfork([] { instance().holdStill(); }, [] { instance().goOn(); }, [] { instance().goOn(); });
}

// In the order in which the locks are taken elsewhere.
void Runtime::holdStill() {
  lookMutex_.lock();
  latestMutex_.lock();
  lockLog();
  configMutex_.lock();
}

void Runtime::goOn() {
  configMutex_.unlock();
  unlockLog();
  latestMutex_.unlock();
  lookMutex_.unlock();
}

const Runtime::LoadedConfig& Runtime::loadedConfig() {
  const LoadedConfig* loaded = loadedConfig_.load(std::memory_order_acquire);
  if (loaded != nullptr) return *loaded;
  const std::lock_guard lock(configMutex_);
  loaded = loadedConfig_.load(std::memory_order_relaxed);
  if (loaded != nullptr) return *loaded;
  LoadedConfig fresh;
  try {
    fresh.config = readDefaultConfig();
  } catch (const ConfigError& error) {
    fresh.error = error;
  }
  configs_.push_back(std::move(fresh));
  loadedConfig_.store(&configs_.back(), std::memory_order_release);
  return configs_.back();
}

const Config& Runtime::config() { return loadedConfig().config; }

void Runtime::checkConfig() {
  const LoadedConfig& loaded = loadedConfig();
  if (loaded.error.has_value()) throw ConfigError(*loaded.error);
}

void Runtime::useConfig(const Config& config) {
  const std::lock_guard look(lookMutex_);
  {
    const std::lock_guard lock(configMutex_);
    configs_.push_back({config, std::nullopt});
    loadedConfig_.store(&configs_.back(), std::memory_order_release);
  }
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

std::shared_ptr<const TreeSnapshot> Runtime::lookAndRead() {
  checkConfig();
  if (process_ != ::getpid()) followFork();
  if (source_ == nullptr) source_ = makeSource(config());
  if (!overlay_.has_value()) overlay_.emplace(config().dataDir);

  // Both are asked every time, so that neither piles up reports.
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

// What was opened before the fork belongs to the parent: reports that are read here would be missing there.
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

// A server asks again with every request.
void Runtime::reportOnce(const std::string& problem) {
  if (problem == reported_) return;
  reported_ = problem;
  ZORVAGENT_LOG_ERROR(problem);
  if (syslogIsInformed_) return;
  syslogIsInformed_ = true;
  ::syslog(LOG_DAEMON | LOG_ERR, "zorvagent: %s", problem.c_str());
}

std::shared_ptr<const TreeSnapshot> Runtime::latestForCursor() {
  {
    const std::lock_guard lock(latestMutex_);
    if (latest_ != nullptr) return latest_;
  }
  return lookForCursor();
}

std::string Runtime::systemName() {
  const LoadedConfig& loaded = loadedConfig();
  if (!loaded.config.systemName.empty()) return loaded.config.systemName;
  if (loaded.error.has_value()) return util::kernelHostName();
  try {
    // Of the tree that the latest cursor was placed in: a name is told many times in one operation, and must not change
    // on the way.
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
  std::shared_ptr<const TreeSnapshot> source;
  {
    const std::lock_guard lock(lookMutex_);
    lookAndRead();
    source = sourceTree_;
  }
  const Node* node = source->find(path);
  if (node == nullptr || node->type() != NodeType::NetworkIPConfig) {
    throw std::invalid_argument("no such node has an IP configuration");
  }
  // The source's own value needs no entry, and is followed from now on wherever it goes.
  const Property* own = node->find(property);
  const bool same = own != nullptr && equalValues(own->value, value);
  overlay().set(path, property, same ? std::nullopt : std::optional<PropertyValue>(value));
  overlayHasChanged();
  return true;
} catch (const std::exception& error) {
  ZORVAGENT_LOG_ERROR(path + ": the value is not stored: " + error.what());
  return false;
}

Overlay Runtime::overlay() {
  checkConfig();
  return Overlay(config().dataDir);
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
  syslogIsInformed_ = false;
  sourceIsGiven_ = false;
  source_ = nullptr;
  loadedConfig_.store(nullptr, std::memory_order_release);
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
