// DSP0200 5.3.2.24: enumerations that a client opens, pulls and closes.

#include <cmpidt.h>

#include "cimom/Operations.h"
#include "cimom/OperationsArguments.h"
#include "cimom/OperationsSelection.h"
#include "cimxml/ElementWriter.h"

namespace zorva::cimom {

namespace {

using broker::Status;

/// The parameters of every opening operation.
struct Opening {
  std::chrono::seconds timeout{};
  std::size_t count = 0;  ///< how many objects are requested at once
};

Status takeCount(const PullLimits& limits, std::optional<std::uint64_t> given, std::size_t& count) {
  count = given.value_or(0);
  if (count <= limits.maxObjects) return {};
  return {CMPI_RC_ERR_INVALID_PARAMETER, "MaxObjectCount is " + std::to_string(count) + ", but a pull gives at most " +
                                             std::to_string(limits.maxObjects) + " objects"};
}

Status takeTimeout(const PullLimits& limits, std::optional<std::uint64_t> given, std::chrono::seconds& timeout) {
  timeout = given ? std::chrono::seconds(*given) : limits.defaultTimeout;
  if (timeout.count() > 0 && timeout <= limits.maxTimeout) return {};
  return {kInvalidOperationTimeout, "OperationTimeout is " + std::to_string(timeout.count()) +
                                        ", but must be from 1 to " + std::to_string(limits.maxTimeout.count()) +
                                        " seconds"};
}

Status takeOpening(Operation& operation, Arguments& arguments, Opening& opening) {
  const std::string language = arguments.text("FilterQueryLanguage").value_or("");
  const std::string query = arguments.text("FilterQuery").value_or("");
  const std::optional<std::uint64_t> timeout = arguments.number("OperationTimeout");
  const bool continues = arguments.boolean("ContinueOnError", false);
  const std::optional<std::uint64_t> count = arguments.number("MaxObjectCount");
  Status status = arguments.status();
  if (!status.ok()) return status;
  if (!language.empty() || !query.empty()) {
    return {kFilteredEnumerationNotSupported, "filter queries are not offered; leave out FilterQuery and its language"};
  }
  if (continues)
    return {kContinuationOnErrorNotSupported,
            "an enumeration ends at its first error; leave out "
            "ContinueOnError"};
  status = takeTimeout(operation.pulls.limits(), timeout, opening.timeout);
  return status.ok() ? takeCount(operation.pulls.limits(), count, opening.count) : status;
}

/// Writes the objects, then whether there are more, and the context.
void write(Operation& operation, const PullObjects& objects, bool ended, const std::string& context) {
  cimxml::ResponseWriter& writer = operation.writer;
  writer.beginReturnValue();
  for (const std::string& text : objects.texts()) {
    writer.out() += text;
    writer.drainIfFull();
  }
  writer.endReturnValue();
  cimxml::appendParameter(writer.out(), {"EndOfSequence", broker::Value::boolean(ended)});
  cimxml::appendParameter(writer.out(), {"EnumerationContext", ended ? broker::Value::null(schema::Type::String)
                                                                     : broker::Value::text(context)});
}

/// Collects the results of a request, as text.
class Collector {
 public:
  explicit Collector(Operation& operation) : operation_(operation), objects_(operation.pulls) {}

  broker::InstanceSink instances(const broker::Selection& selection) {
    return [this, writer = cimxml::InstanceWriter(detailOf(operation_, selection))](
               const broker::Instance& instance) mutable {
      if (!mayRead(operation_, instance.path)) return true;
      text_ = "<VALUE.INSTANCEWITHPATH>";
      cimxml::appendWholePath(text_, instance.path, operation_.host.name());
      writer.append(text_, instance);
      text_ += "</VALUE.INSTANCEWITHPATH>";
      return add();
    };
  }

  broker::PathSink paths() {
    return [this](const broker::ObjectPath& path) {
      if (!mayRead(operation_, path)) return true;
      text_.clear();
      cimxml::appendWholePath(text_, path, operation_.host.name());
      return add();
    };
  }

  /// Sends the first objects and keeps the rest.
  Status answer(PullForm form, const Opening& opening, Status status) {
    if (isFull_) {
      return {kServerLimitsExceeded, "the open enumerations hold more than " +
                                         std::to_string(operation_.pulls.limits().maxBytes) +
                                         " bytes; close some, or enumerate without pulling"};
    }
    if (!status.ok()) return status;
    PullObjects first(operation_.pulls);
    objects_.moveTo(first, opening.count);
    std::string context;
    const bool ended = objects_.size() == 0;
    if (!ended) {
      status = operation_.pulls.keep(operation_.client, form, operation_.nameSpace, objects_, opening.timeout, context);
      if (!status.ok()) return status;
    }
    write(operation_, first, ended, context);
    return {};
  }

 private:
  bool add() {
    isFull_ = !objects_.add(text_);
    return !isFull_;
  }

  Operation& operation_;
  PullObjects objects_;
  std::string text_;
  bool isFull_ = false;
};

Status openEnumerateInstances(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string className = arguments.requiredClassName("ClassName");
  broker::Selection selection;
  selection.deepInheritance = arguments.boolean("DeepInheritance", true);
  selection.includeClassOrigin = arguments.boolean("IncludeClassOrigin", false);
  selection.propertyList = arguments.names("PropertyList");
  Opening opening;
  Status status = takeOpening(operation, arguments, opening);
  if (!status.ok()) return status;
  Collector collector(operation);
  status = operation.broker.enumerateInstances(operation.nameSpace, className, selection,
                                               collector.instances(selection), operation.caller);
  return collector.answer(PullForm::Instances, opening, std::move(status));
}

Status openEnumerateInstancePaths(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string className = arguments.requiredClassName("ClassName");
  Opening opening;
  Status status = takeOpening(operation, arguments, opening);
  if (!status.ok()) return status;
  Collector collector(operation);
  status = operation.broker.enumerateInstanceNames(operation.nameSpace, className, collector.paths(), operation.caller);
  return collector.answer(PullForm::Paths, opening, std::move(status));
}

template <bool ofReferences>
Status openAssociated(Operation& operation) {
  Arguments arguments(operation.call);
  broker::ObjectPath path = arguments.requiredPath("InstanceName");
  const broker::AssociationFilter filter = takeFilter(arguments, ofReferences);
  broker::Selection selection;
  selection.includeClassOrigin = arguments.boolean("IncludeClassOrigin", false);
  selection.propertyList = arguments.names("PropertyList");
  Opening opening;
  Status status = takeOpening(operation, arguments, opening);
  if (status.ok()) status = canonicalizePath(operation, path);
  if (!status.ok()) return status;
  Collector collector(operation);
  const broker::InstanceSink sink = collector.instances(selection);
  status = ofReferences ? operation.broker.references(path, filter, selection, sink, operation.caller)
                        : operation.broker.associators(path, filter, selection, sink, operation.caller);
  return collector.answer(PullForm::Instances, opening, std::move(status));
}

template <bool ofReferences>
Status openAssociatedPaths(Operation& operation) {
  Arguments arguments(operation.call);
  broker::ObjectPath path = arguments.requiredPath("InstanceName");
  const broker::AssociationFilter filter = takeFilter(arguments, ofReferences);
  Opening opening;
  Status status = takeOpening(operation, arguments, opening);
  if (status.ok()) status = canonicalizePath(operation, path);
  if (!status.ok()) return status;
  Collector collector(operation);
  const broker::PathSink sink = collector.paths();
  status = ofReferences ? operation.broker.referenceNames(path, filter, sink, operation.caller)
                        : operation.broker.associatorNames(path, filter, sink, operation.caller);
  return collector.answer(PullForm::Paths, opening, std::move(status));
}

template <PullForm form>
Status pull(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string context = arguments.requiredText("EnumerationContext");
  const std::optional<std::uint64_t> given = arguments.number("MaxObjectCount");
  Status status = arguments.status();
  std::size_t count = 0;
  if (status.ok()) status = takeCount(operation.pulls.limits(), given, count);
  PullObjects taken(operation.pulls);
  bool ended = false;
  if (status.ok()) status = operation.pulls.take(context, operation.nameSpace, form, count, taken, ended);
  if (status.ok()) write(operation, taken, ended, context);
  return status;
}

Status closeEnumeration(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string context = arguments.requiredText("EnumerationContext");
  Status status = arguments.status();
  return status.ok() ? operation.pulls.close(context, operation.nameSpace) : status;
}

Status enumerationCount(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string context = arguments.requiredText("EnumerationContext");
  Status status = arguments.status();
  std::uint64_t left = 0;
  if (status.ok()) status = operation.pulls.count(context, operation.nameSpace, left);
  if (!status.ok()) return status;
  operation.writer.beginReturnValue();
  cimxml::appendValue(operation.writer.out(), broker::Value::unsignedNumber(left));
  operation.writer.endReturnValue();
  return {};
}

}  // namespace

OperationFunction findPullOperation(std::string_view name) noexcept {
  constexpr std::pair<std::string_view, OperationFunction> kOperations[] = {
      {"OpenEnumerateInstances", openEnumerateInstances},
      {"OpenEnumerateInstancePaths", openEnumerateInstancePaths},
      {"OpenAssociatorInstances", openAssociated<false>},
      {"OpenAssociatorInstancePaths", openAssociatedPaths<false>},
      {"OpenReferenceInstances", openAssociated<true>},
      {"OpenReferenceInstancePaths", openAssociatedPaths<true>},
      {"PullInstancesWithPath", pull<PullForm::Instances>},
      {"PullInstancePaths", pull<PullForm::Paths>},
      {"CloseEnumeration", closeEnumeration},
      {"EnumerationCount", enumerationCount},
  };
  for (const auto& [known, function] : kOperations) {
    if (util::sameName(known, name)) return function;
  }
  return nullptr;
}

}  // namespace zorva::cimom
