#include "broker/core/ProviderLoader.h"

#include <dlfcn.h>
#include <unistd.h>

#include <algorithm>
#include <exception>
#include <set>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Data.h"
#include "broker/objects/Scope.h"
#include "util/NotCopied.h"

namespace zorva::broker {

struct ProviderLoader::Library : private util::NotCopied {
  explicit Library(void* opened) : handle(opened) {}
  ~Library() {
    if (!stays) dlclose(handle);
  }

  void* handle;
  bool stays = false;
};

namespace {

/// The file names that a library's name may mean, best first.
std::vector<std::string> candidates(const std::string& directory, const std::string& name) {
  if (name.find('/') != std::string::npos) return {name};
  const std::string stem = (directory.empty() ? "" : directory + "/") + "lib" + name + ".so";
  return {stem + ".1", stem};
}

}  // namespace

ProviderLoader::ProviderLoader(LoaderHost host, const ProviderRegistry& registry, std::string directory,
                               std::vector<LinkedFunction> linked)
    : host_(std::move(host)), directory_(std::move(directory)), linked_(std::move(linked)) {
  for (const ProviderEntry& entry : registry.entries()) {
    auto known = std::find_if(providers_.begin(), providers_.end(), [&](const auto& provider) {
      return provider->prefix == entry.prefix && provider->library == entry.library;
    });
    if (known == providers_.end()) known = providers_.insert(known, std::make_unique<Provider>());
    (*known)->prefix = entry.prefix;
    (*known)->library = entry.library;
    (*known)->nameSpace = entry.nameSpace;
    (*known)->kinds |= entry.kinds;
  }
}

ProviderLoader::~ProviderLoader() {
  for (const auto& provider : providers_) {
    bool stays = cleanUp(*provider, &Provider::instance);
    stays = cleanUp(*provider, &Provider::association) || stays;
    stays = cleanUp(*provider, &Provider::method) || stays;
    if (stays && !provider->library.empty()) libraries_.at(provider->library)->stays = true;
  }
}

template <typename Mi>
bool ProviderLoader::cleanUp(Provider& provider, std::atomic<const Mi*> Provider::*slot) noexcept {
  const Mi* mi = (provider.*slot).load();
  if (mi == nullptr || mi->ft->cleanup == nullptr) return false;
  try {
    Scope scope(host_.classes, host_.blocks);
    auto* context = scope.arena().make<ContextObject>(scope.arena());
    const CMPIStatus status = mi->ft->cleanup(const_cast<Mi*>(mi), context, 1);
    return status.rc == CMPI_RC_DO_NOT_UNLOAD || status.rc == CMPI_RC_NEVER_UNLOAD;
  } catch (...) {
    host_.warn(provider.prefix + " threw an exception out of its cleanup");
    return false;
  }
}

ProviderLoader::Provider& ProviderLoader::providerOf(const ProviderEntry& entry) const {
  return **std::find_if(providers_.begin(), providers_.end(), [&](const auto& provider) {
    return provider->prefix == entry.prefix && provider->library == entry.library;
  });
}

ProviderLoader::Library* ProviderLoader::open(const std::string& name, Status& status) {
  const auto known = libraries_.find(name);
  if (known != libraries_.end()) return known->second.get();
  const std::vector<std::string> files = candidates(directory_, name);
  const bool searched = files.front().find('/') == std::string::npos;
  std::string problem;
  for (const std::string& file : files) {
    if (!searched && access(file.c_str(), F_OK) != 0) continue;
    if (void* handle = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL)) {
      return libraries_.emplace(name, std::make_unique<Library>(handle)).first->second.get();
    }
    if (problem.empty()) problem = dlerror();
  }
  status.rc = CMPI_RC_ERR_FAILED;
  status.message = problem.empty() ? "there is no provider library " + files.front()
                                   : "the provider library cannot be loaded: " + problem;
  return nullptr;
}

template <typename Mi>
const Mi* ProviderLoader::find(const ProviderEntry& entry, std::atomic<const Mi*> Provider::*slot, MiKind kind,
                               Status& status) {
  Provider& provider = providerOf(entry);
  if (const Mi* made = (provider.*slot).load(std::memory_order_acquire)) return made;
  const std::lock_guard lock(mutex_);
  if (const Mi* made = (provider.*slot).load(std::memory_order_relaxed)) return made;
  if (provider.isBeingMade) {
    status = {CMPI_RC_ERR_FAILED, provider.prefix + " asks for itself while it is being made"};
    return nullptr;
  }
  provider.isBeingMade = true;
  makeAll(provider, kind, status);
  provider.isBeingMade = false;
  return (provider.*slot).load(std::memory_order_relaxed);
}

void ProviderLoader::makeAll(Provider& provider, MiKind wanted, Status& status) {
  Status unheeded;  // a kind that cannot be made is reported to the request that needs it
  const auto lacks = [&](MiKind kind, bool made) { return (provider.kinds & kind) != 0 && !made; };
  const auto statusOf = [&](MiKind kind) -> Status& { return kind == wanted ? status : unheeded; };
  const CMPIInstanceMI* instance = provider.instance.load();
  const CMPIAssociationMI* association = provider.association.load();
  const CMPIMethodMI* method = provider.method.load();
  if (lacks(InstanceMi, instance != nullptr)) {
    instance = make<CMPIInstanceMI>(provider, "InstanceMI", statusOf(InstanceMi));
  }
  if (lacks(AssociationMi, association != nullptr)) {
    association = make<CMPIAssociationMI>(provider, "AssociationMI", statusOf(AssociationMi));
  }
  if (lacks(MethodMi, method != nullptr)) method = make<CMPIMethodMI>(provider, "MethodMI", statusOf(MethodMi));
  provider.instance.store(instance, std::memory_order_release);
  provider.association.store(association, std::memory_order_release);
  provider.method.store(method, std::memory_order_release);
}

void* ProviderLoader::findFunction(const Provider& provider, const std::string& function, Status& status) {
  if (provider.library.empty()) {
    for (const LinkedFunction& one : linked_) {
      if (one.name == function) return reinterpret_cast<void*>(one.function);
    }
    status.message = "the program has no function " + function;
    return nullptr;
  }
  Library* library = open(provider.library, status);
  if (library == nullptr) return nullptr;
  void* found = dlsym(library->handle, function.c_str());
  if (found == nullptr) status.message = "the provider library " + provider.library + " has no function " + function;
  return found;
}

template <typename Mi>
const Mi* ProviderLoader::make(const Provider& provider, const char* kind, Status& status) {
  const std::string function = provider.prefix + "_Create_" + kind;
  using Create = Mi* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  const auto create = reinterpret_cast<Create>(findFunction(provider, function, status));
  status.rc = CMPI_RC_ERR_FAILED;
  if (create == nullptr) return nullptr;
  Scope scope(host_.classes, host_.blocks);
  auto* context = scope.arena().make<ContextObject>(scope.arena());
  context->setText(CMPIInitNameSpace, provider.nameSpace);
  CMPIStatus created{CMPI_RC_OK, nullptr};
  Mi* mi = nullptr;
  try {
    mi = create(host_.handle, context, &created);
  } catch (const std::exception& problem) {
    status.message = function + " threw an exception: " + problem.what();
    return nullptr;
  }
  if (mi == nullptr || mi->ft == nullptr || created.rc != CMPI_RC_OK) {
    status.message = function + " made no provider";
    if (created.msg != nullptr) status.message += ": " + std::string(textOf(created.msg));
    return nullptr;
  }
  status = {};
  return mi;
}

const CMPIInstanceMI* ProviderLoader::instanceMi(const ProviderEntry& entry, Status& status) {
  return find(entry, &Provider::instance, InstanceMi, status);
}

const CMPIAssociationMI* ProviderLoader::associationMi(const ProviderEntry& entry, Status& status) {
  return find(entry, &Provider::association, AssociationMi, status);
}

const CMPIMethodMI* ProviderLoader::methodMi(const ProviderEntry& entry, Status& status) {
  return find(entry, &Provider::method, MethodMi, status);
}

std::vector<std::string> ProviderLoader::openAll() {
  const std::lock_guard lock(mutex_);
  std::set<std::string> names;
  for (const auto& provider : providers_) names.insert(provider->library);
  names.erase("");  // providers that are linked into the program
  std::vector<std::string> problems;
  for (const std::string& name : names) {
    Status status;
    if (open(name, status) == nullptr) problems.push_back(std::move(status.message));
  }
  return problems;
}

}  // namespace zorva::broker
