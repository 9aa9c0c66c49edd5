#pragma once

// Calls a provider through its function tables, as a CIM server would, and returns all results.

#include <cmpift.h>

#include <cstddef>
#include <initializer_list>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "tests/support/CimValues.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"

namespace ZV::Test {

/// The results of one operation.
struct Outcome {
  CMPIrc rc = CMPI_RC_OK;
  std::optional<std::string> message;  ///< of the status
  Results result;
  std::vector<NamedValue> out;  ///< output arguments of a method
  Calls calls;                  ///< the provider's calls to the broker and its objects
  LogLines lines;               ///< the log pairs, one line each, if a RecordingLogger was active

  const std::vector<Instance>& instances() const { return result.instances; }
  const std::vector<Path>& paths() const { return result.paths; }
  bool done() const { return result.done(); }
  std::vector<std::string> errors() const { return lines.errors(); }

  /// Whether the operation's entry and exit marks are there: the last line of the entry, the first of the exit.
  bool markedEntry() const;
  bool markedExit() const;

  /// The calls that make, change or return something, and the log lines, in the order in which they happened; a log
  /// line as `log 6000 MESSAGE No ObjectPath Found`.
  std::vector<std::string> story() const;
};

std::ostream& operator<<(std::ostream& out, const Outcome& outcome);
const char* nameOf(CMPIrc rc);

/// A property list: null, which requests everything, or names; {} is a list of no names.
class PropertyList {
 public:
  PropertyList(std::nullptr_t) {}
  PropertyList(std::initializer_list<std::string> names) : names_(names) {}
  explicit PropertyList(std::vector<std::string> names) : names_(std::move(names)) {}

  /// The list in CMPI's form, valid as long as this is.
  const char** cmpi();

 private:
  std::optional<std::vector<std::string>> names_;
  std::vector<const char*> pointers_;
};

/// The arguments of an association operation besides the path; null if left out.
struct AssociationQuery {
  const char* assocClass = nullptr;
  const char* resultClass = nullptr;
  const char* role = nullptr;
  const char* resultRole = nullptr;
  PropertyList properties = nullptr;
};

// Each provider is made by its create function and called with objects of the broker that are named in call lines as
// context, ref (the operation's path), instance, in and out. Exceptions of the provider reach the test. Each operation
// begins a new request of the broker (RecordingBroker::beginRequest).

class InstanceProvider {
 public:
  using Create = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  InstanceProvider(Create create, RecordingBroker& broker);

  CMPIInstanceMI* mi() const { return mi_; }
  Outcome cleanup(bool terminating = true);
  Outcome enumerateInstanceNames(const Path& path);
  Outcome enumerateInstances(const Path& path, PropertyList properties = nullptr);
  Outcome getInstance(const Path& path, PropertyList properties = nullptr);
  Outcome createInstance(const Path& path, const Instance& instance);
  Outcome modifyInstance(const Path& path, const Instance& instance, PropertyList properties = nullptr);
  Outcome deleteInstance(const Path& path);
  Outcome execQuery(const Path& path, const char* query, const char* language);

 private:
  RecordingBroker& broker_;
  CMPIInstanceMI* mi_;
};

class AssociationProvider {
 public:
  using Create = CMPIAssociationMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  AssociationProvider(Create create, RecordingBroker& broker);

  CMPIAssociationMI* mi() const { return mi_; }
  Outcome cleanup(bool terminating = true);
  Outcome associators(const Path& path, AssociationQuery query);
  Outcome associatorNames(const Path& path, const AssociationQuery& query);
  Outcome references(const Path& path, AssociationQuery query = {});  ///< of the query: resultClass, role, properties
  Outcome referenceNames(const Path& path, const AssociationQuery& query = {});

 private:
  RecordingBroker& broker_;
  CMPIAssociationMI* mi_;
};

class MethodProvider {
 public:
  using Create = CMPIMethodMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  MethodProvider(Create create, RecordingBroker& broker);

  CMPIMethodMI* mi() const { return mi_; }
  Outcome cleanup(bool terminating = true);
  Outcome invokeMethod(const Path& path, const char* method, const std::vector<NamedValue>& arguments = {});

 private:
  RecordingBroker& broker_;
  CMPIMethodMI* mi_;
};

}  // namespace ZV::Test
