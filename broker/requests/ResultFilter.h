#pragma once

// Filters results between a provider and their receiver: providers return more than was requested, and with incomplete
// names.

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

namespace zorva::broker {

/// The requested part of each instance, like Selection in Operations.h, with the names as the client gave them.
struct Shape {
  bool localOnly = false;
  bool deepInheritance = true;
  std::optional<std::vector<std::string_view>> properties;
};

/// A receiver that takes each instance with the mask of its requested properties.
class Taker {
 public:
  virtual ~Taker() = default;
  virtual bool takeInstance(const InstanceObject& instance, const PropertyMask& wanted) = 0;
  virtual bool takePath(const PathObject& path) = 0;
};

/// Passes on only what was requested: each instance with the mask of its requested properties, each name with its
/// namespace. Logs what it drops.
class ResultFilter : public Receiver {
 public:
  /// `requested`: the class to which localOnly and deepInheritance refer; null if they do not apply. All arguments
  /// outlive the filter.
  ResultFilter(BrokerCore& core, Scope& scope, const Shape& shape, const ClassInfo* requested,
               std::string_view nameSpace, Taker& taker)
      : core_(core), scope_(scope), shape_(shape), requested_(requested), nameSpace_(nameSpace), taker_(taker) {}

  const ClassInfo* within = nullptr;    ///< results are of this class or below; null: any
  const ClassInfo* servedAs = nullptr;  ///< results belong to this class, not to a subclass that has its own provider

  /// The taker needs no more.
  bool full() const noexcept { return full_; }

  bool takeInstance(const InstanceObject& instance) override;
  bool takePath(const PathObject& path) override;

 private:
  bool admits(const ClassInfo& info);
  /// Logs one line for each class: a provider may return thousands of instances.
  void logDrop(const ClassInfo& info, std::string_view why);
  bool isServed(const schema::Class& declared) const;
  bool includes(const PropertyInfo& property) const;
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
