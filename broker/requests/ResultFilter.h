#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "broker/core/BrokerCore.h"
#include "broker/objects/Convert.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/requests/Result.h"

// Between a provider and who takes its results: providers return more than was asked for, and less well named.

namespace zorva::broker {

/// What of each instance is wanted, as Selection in Broker.h, with the names as they came.
struct Shape {
  bool localOnly = false;
  bool deepInheritance = true;
  std::optional<std::vector<std::string_view>> properties;
};

/// A receiver that takes instances with the mask of the properties that are wanted of them.
class Taker {
 public:
  virtual ~Taker() = default;
  virtual bool takeInstance(const InstanceObject& instance, const PropertyMask& wanted) = 0;
  virtual bool takePath(const PathObject& path) = 0;
};

/// Lets pass what was asked for, each instance with the mask of its wanted properties, each name with its namespace.
/// What it drops it logs.
class ResultFilter : public Receiver {
 public:
  /// `requested`: the class that localOnly and deepInheritance are about; null where they do not apply. All that is
  /// referred to outlives the filter.
  ResultFilter(BrokerCore& core, Scope& scope, const Shape& shape, const ClassInfo* requested,
               std::string_view nameSpace, Taker& taker)
      : core_(core), scope_(scope), shape_(shape), requested_(requested), nameSpace_(nameSpace), taker_(taker) {}

  const ClassInfo* within = nullptr;    ///< results are of this class or below; null: any
  const ClassInfo* servedAs = nullptr;  ///< results belong to this class, not to one below that is served itself

  /// The taker wants no more.
  bool full() const noexcept { return full_; }

  bool takeInstance(const InstanceObject& instance) override;
  bool takePath(const PathObject& path) override;

 private:
  bool admits(const ClassInfo& info);
  /// One line for each class: a provider may return thousands.
  void logDrop(const ClassInfo& info, std::string_view why);
  bool isServed(const schema::Class& declared) const;
  bool wants(const PropertyInfo& property) const;
  PropertyMask maskOf(const ClassInfo& info);

  BrokerCore& core_;
  Scope& scope_;
  const Shape& shape_;
  const ClassInfo* const requested_;
  const std::string nameSpace_;
  Taker& taker_;
  bool full_ = false;
  std::vector<std::pair<const ClassInfo*, std::vector<std::uint64_t>>> masks_;
  std::vector<const ClassInfo*> logged_;
};

}  // namespace zorva::broker
