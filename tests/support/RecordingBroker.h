#pragma once

// A CMPI broker that records every call to it and to its objects, and fails where a test asks it to.

#include <cmpift.h>

#include <cstddef>
#include <functional>
#include <initializer_list>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "tests/support/CimValues.h"

namespace ZV::Test {

/// How a call into the broker fails. A call that cannot fail in a mode does the nearest: a call that only returns a
/// status fails by its rc in every mode, a count or a flag that is null is 0, a text without a handle is null.
enum class Mode {
  SetRc,       ///< rc CMPI_RC_ERR_FAILED with a message, yet the object is good
  ReturnNull,  ///< rc CMPI_RC_OK, null
  NullHandle,  ///< rc CMPI_RC_OK, an object whose hdl is null
  RcAndNull,   ///< rc CMPI_RC_ERR_FAILED with a message, and null
  Throw,       ///< throws an InjectedFailure
};
inline constexpr Mode kAllStatusModes[] = {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull};
const char* nameOf(Mode mode);

class InjectedFailure : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// One call: the name of the slot, and the complete line.
struct RecordedCall {
  std::string name;
  std::string line;
  std::size_t place = 0;  ///< among all calls and log lines of the process
};

/// The calls in order, as a test compares them.
class Calls : public std::vector<RecordedCall> {
 public:
  using std::vector<RecordedCall>::vector;

  /// All lines.
  std::vector<std::string> lines() const;
  /// Lines of the calls that make, change or return something: calls that only read an object or a text are left out
  /// (getKey, getCharPtr, getNameSpace, hasNext and the like).
  std::vector<std::string> steps() const;
  /// Lines of the calls of these names.
  std::vector<std::string> only(std::initializer_list<std::string_view> names) const;
  /// Lines of all calls but those of these names.
  std::vector<std::string> without(std::initializer_list<std::string_view> names) const;
  std::size_t count(std::string_view name) const;
};

/// What a provider has put into its result.
struct Results {
  std::vector<Instance> instances;  ///< without null ones
  std::vector<Path> paths;          ///< without null ones
  std::vector<Value> data;
  int doneCount = 0;
  bool done() const { return doneCount != 0; }
};

/// A broker's answer for a name that an object does not have.
struct Missing {
  CMPIrc rc;
  CMPIValueState state;
};

/// The broker's objects of a class that another provider serves.
struct ServedClass {
  std::vector<Instance> instances;
  CMPIrc rc = CMPI_RC_OK;        ///< the status of each enumeration; not OK without instances gives a null enumeration
  bool nullEnumeration = false;  ///< null, whatever the rc is
  bool throws = false;           ///< throws an InjectedFailure
};

struct Call;
struct BrokerObject;
struct PathObject;
struct InstanceObject;
struct StringObject;
struct ArrayObject;
struct EnumerationObject;
struct ResultObject;
struct ContextObject;
struct ArgsObject;
struct DateTimeObject;

/// Objects that the broker makes for a provider are called OP1, OP2 for object paths, and likewise I for instances, A
/// for arrays, E for enumerations, AR for arguments, C for contexts, DT for dates; a string has its text as name.
/// Objects that a test makes are called what the test calls them. The broker has no schema: an instance's path has the
/// keys that setPropertyFilter named, or else those of a small table of classes (setKeysOfClass). Names match without
/// regard to case. A null status pointer is tolerated everywhere. A handle that is null makes a call answer
/// CMPI_RC_ERR_INVALID_HANDLE and changes nothing.
///
/// The broker owns every object and ends them all with itself, or at freeSince. Recording is safe from several threads;
/// an object belongs to one.
class RecordingBroker {
 public:
  RecordingBroker();
  ~RecordingBroker();

  const CMPIBroker* cmpi() const { return &broker_; }

  /// Makes objects for a call of a provider. They are not recorded as calls.
  CMPIObjectPath* make(const Path& path, const std::string& label = "path");
  CMPIInstance* make(const Instance& instance, const std::string& label = "instance");
  CMPIString* makeString(const std::string& text);
  CMPIArray* makeArray(const Value& list, const std::string& label = "array");
  CMPIArgs* makeArgs(const std::vector<NamedValue>& arguments, const std::string& label = "args");
  CMPIContext* makeContext(const std::string& label = "context");
  CMPIResult* makeResult(const std::string& label = "result");
  CMPIData makeData(const Value& value);

  /// The current content of an object of any RecordingBroker. Not recorded. A null object or handle gives an empty
  /// record.
  static Path read(const CMPIObjectPath* path);
  static Instance read(const CMPIInstance* instance);
  static std::vector<NamedValue> read(const CMPIArgs* arguments);
  static std::string read(const CMPIString* string);
  static Results read(const CMPIResult* result);

  /// The keys of a class, in order, for getObjectPath and enumerateInstanceNames.
  void setKeysOfClass(const std::string& className, std::vector<std::string> names);
  const std::vector<std::string>& keysOfClass(const std::string& className) const;

  /// The class as another provider serves it, to be filled by the test. A class that was never named here answers
  /// CMPI_RC_ERR_INVALID_CLASS and null.
  ServedClass& serve(const std::string& className, std::vector<Instance> instances = {});

  Missing missingKey{CMPI_RC_ERR_NOT_FOUND, CMPI_notFound};
  Missing missingProperty{CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_notFound};
  Missing missingArgument{CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_notFound};
  bool keepsLines = true;  ///< false: calls are counted but not recorded, for long runs

  /// Added to the state of a good value by the call that returns it. Some servers mark keys with CMPI_keyValue, others
  /// leave CMPI_nullValue there.
  CMPIValueState stateOfKeys = CMPI_goodValue;
  CMPIValueState stateOfNexts = CMPI_goodValue;  ///< for getNext
  CMPIValueState stateOfElements = CMPI_goodValue;
  CMPIValueState stateOfArguments = CMPI_goodValue;
  void addToAllStates(CMPIValueState state);

  /// Failures: at the n-th call from now on, counted from 1; at the next call of a slot; at each call of it.
  void failAt(std::size_t n, Mode mode);
  void failNext(const std::string& name, Mode mode);
  void failEach(const std::string& name, Mode mode);
  void failNever();
  bool hasFailed() const;  ///< whether any failure was reached since startOver

  /// Paths of a class that newObjectPath gave lose their handles when it gives one of another class: a broker that
  /// takes its memory back too early.
  void loseHandles(const std::string& victims, const std::string& occasion) { lossOfHandles_ = {victims, occasion}; }

  Calls calls() const;            ///< since the last request began, or since startOver
  std::size_t callCount() const;  ///< since startOver
  std::size_t callsOf(const std::string& name) const { return calls().count(name); }

  /// Drops the recorded calls and numbers new objects from 1 again, as at the beginning of a request. Requested
  /// failures stay.
  void beginRequest();

  /// Drops recorded calls and failures and numbers new objects from 1 again; objects are not changed.
  void startOver();

  /// Ends all objects that were made after mark() gave this number.
  std::size_t mark() const;
  void freeSince(std::size_t mark);

 private:
  friend struct Call;
  friend struct BrokerEncapsulation;
  friend struct BrokerUpCalls;
  friend struct ObjectTables;

  template <typename Object>
  Object* add(std::unique_ptr<Object> object, const char* kind, const std::string& label);
  PathObject* addPath(Path path, const std::string& label = {});
  PathObject* addNewPath(Path path);  ///< for newObjectPath
  InstanceObject* addInstance(Instance instance, const std::string& label = {});
  StringObject* addString(std::string text);
  ArrayObject* addArray(CMPIType elementType, std::vector<Value> elements, const std::string& label = {});
  EnumerationObject* addEnumeration(std::vector<Value> elements);
  ResultObject* addResult(const std::string& label = {});
  ContextObject* addContext(const std::string& label = {});
  ArgsObject* addArgs(std::vector<NamedValue> arguments, const std::string& label = {});
  DateTimeObject* addDateTime(std::string text);

  /// Counts and records one call and says how it must fail. Throws InjectedFailure if it must throw.
  std::optional<Mode> record(const char* name, std::string line);

  CMPIBroker broker_;
  mutable std::mutex mutex_;
  Calls calls_;
  std::size_t callCount_ = 0;
  bool hasFailed_ = false;
  std::optional<std::pair<std::size_t, Mode>> failAt_;
  std::map<std::string, Mode> failNext_;
  std::map<std::string, Mode> failEach_;
  std::pair<std::string, std::string> lossOfHandles_;  ///< of which class, at which
  std::vector<PathObject*> pathsToLose_;
  std::map<std::string, int> numbers_;
  std::vector<std::unique_ptr<BrokerObject>> objects_;
  std::map<std::string, std::vector<std::string>> keysOfClass_;
  std::map<std::string, ServedClass> served_;
};

/// Repeats the operation with the broker failing at its 1st call, its 2nd, and so on in each of the modes, until the
/// operation makes no further call. The operation makes its request and checks how it ended. Returns the number of
/// failures that were tried.
std::size_t forEachFailure(RecordingBroker& broker, const std::function<void(std::size_t n, Mode mode)>& operation,
                           std::initializer_list<Mode> modes = {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle,
                                                                Mode::RcAndNull});

/// An object that a provider made, read and described.
std::string describe(const CMPIObjectPath* path);
std::string describe(const CMPIInstance* instance);

}  // namespace ZV::Test
