#pragma once

// One request, of a client or of a provider's up-call: which providers are asked, what they get, and which of their
// results are passed on. It opens a scope on its thread that ends with it.

#include <memory>
#include <string_view>
#include <vector>

#include "broker/core/BrokerCore.h"
#include "broker/objects/Convert.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/requests/HeldClaim.h"
#include "broker/requests/Operations.h"
#include "broker/requests/Result.h"
#include "broker/requests/ResultFilter.h"
#include "util/Expected.h"
#include "util/NotCopied.h"

namespace zorva::broker {

/// As AssociationFilter in Broker.h.
struct FarEnd {
  std::string_view associationClass;
  std::string_view resultClass;
  std::string_view role;
  std::string_view resultRole;
};

/// Instances or names: the two forms of most read operations.
enum class Form { Instances, Paths };

class Request : util::NotCopied {
 public:
  explicit Request(BrokerCore& core);

  Scope& scope() noexcept { return scope_; }
  Arena& arena() noexcept { return scope_.arena(); }
  /// The context for the providers; empty at first.
  ContextObject& context() noexcept { return context_; }

  /// Takes the claim that providers of a class need, unless this request has one already; `held` stays null if there is
  /// none.
  Status claim(Access access, std::string_view className, const ObjectPath* changed, std::unique_ptr<HeldClaim>& held);

  /// The operations. `path` lives in this request's arena or outlives it. Its namespace may be in any spelling; empty
  /// means the default. Statuses as in Broker.h.
  Status enumerate(const PathObject& path, Form form, const Shape& shape, Taker& taker);
  Status get(const PathObject& path, const Shape& shape, Taker& taker);
  Status create(const PathObject& path, const InstanceObject& instance, Taker& taker);
  /// `effect`, where it is not null, gets what is changed, and its values before.
  Status modify(const PathObject& path, const InstanceObject& instance, const Shape& shape,
                ModificationEffect* effect = nullptr);
  Status remove(const PathObject& path);
  Status associated(const PathObject& path, Form form, const FarEnd& filter, const Shape& shape, Taker& taker);
  Status referring(const PathObject& path, Form form, const FarEnd& filter, const Shape& shape, Taker& taker);
  Status invoke(const PathObject& path, std::string_view method, const EntryList& input, CMPIData& value,
                EntryList& output);

  /// `path` with the class `info` and the namespace as the registry spells it; a failure if either is unknown.
  Expected<PathObject*, Status> resolve(const PathObject& path);

 private:
  struct Association;
  struct Target {
    const ProviderEntry* entry;
    CMPIInstanceMI* mi;
  };

  Status tooDeep() const;
  const ProviderEntry* entryOf(const PathObject& path, const ClassInfo& info, MiKind kind) const;
  std::vector<const ClassInfo*> servedBelow(const PathObject& path, const ClassInfo& info) const;
  Status findAssociations(const PathObject& path, const FarEnd& filter, bool farEndMatters,
                          std::vector<Association>& found, const ClassInfo*& resultClass) const;
  const char** providerList(const Shape& shape, const std::vector<const ClassInfo*>& classes);

  /// Calls a function of a provider's table, null if the provider lacks it. Its exceptions become a failure.
  template <typename Function, typename... Args>
  Status call(ResultObject& result, const ProviderEntry& entry, std::string_view operation, Function function,
              Args... args);
  template <typename Ask>
  Status askEach(const std::vector<Association>& associations, const ResultFilter& results, Ask&& ask);
  Status enumerateOne(const PathObject& path, const ClassInfo& info, Form form, const Shape& shape,
                      ResultFilter& filter, bool& unavailable);
  /// The provider of the instances of a path that resolve() returned. `operation` is for the text of a failure.
  Expected<Target, Status> findInstanceMi(const PathObject& resolved, std::string_view operation);

  BrokerCore& core_;
  Scope scope_;
  ContextObject& context_;
};

}  // namespace zorva::broker
