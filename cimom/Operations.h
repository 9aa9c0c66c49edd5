#pragma once

#include <exception>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/Broker.h"
#include "cimom/Pull.h"
#include "cimom/ServiceHost.h"
#include "cimxml/RequestReader.h"
#include "cimxml/ResponseWriter.h"

// The operations of DSP0200 1.4: each takes its parameters from a call, has the broker or the schema do the work, and
// writes its response while the results come.

namespace zorva::cimom {

/// All that an operation works with. It lives as long as one call.
struct Operation {
  broker::Broker& broker;
  PullTable& pulls;
  const ServiceHost& host;
  const broker::Caller& caller;
  const cimxml::Call& call;
  cimxml::ResponseWriter& writer;
  const std::string& client;    ///< http::HttpRequest::client
  std::string_view hostHeader;  ///< as the client named this host
  std::string nameSpace;        ///< as the registry spells it
  /// Takes the rest of a line that says what the client has changed.
  std::function<void(const std::string& what)> noteChange;

  const schema::ClassRepository& classes() const { return broker.classes(); }
};

/// Carries out a call and writes the content of its response. On a failure, what was written is to be taken back, if it
/// still can be; its `rc` is a CIM status code. Throws what the writer throws, and nothing else save for want of
/// memory.
broker::Status carryOut(Operation& operation);

// What the files of the operations share.

using OperationFunction = broker::Status (*)(Operation& operation);

/// Nothing where the file has no operation of that name.
OperationFunction findInstanceOperation(std::string_view name) noexcept;
OperationFunction findAssociationOperation(std::string_view name) noexcept;
OperationFunction findClassOperation(std::string_view name) noexcept;
OperationFunction findPullOperation(std::string_view name) noexcept;
broker::Status invokeMethod(Operation& operation);

/// The path as the broker takes it: in the call's namespace, the host left out where it is this one, in references too,
/// a nameless key under its name, and keys that are left out added where they can only be those of one instance. A path
/// of another host is CIM_ERR_INVALID_PARAMETER.
broker::Status settlePath(const Operation& operation, broker::ObjectPath& path);
/// The same for the references among a value.
void settleValue(const Operation& operation, broker::Value& value);

/// Leaves a line about a change that succeeded: what was done to which object, and which of its properties or
/// parameters were named.
void noteChange(const Operation& operation, std::string_view what, const broker::ObjectPath& path,
                const std::vector<std::string>& names = {});

/// Carries what the writer throws past a provider, which must not see it: write in put(), then finish().
class Stream {
 public:
  explicit Stream(cimxml::ResponseWriter& writer) : writer_(writer) {}

  /// Runs `append(std::string&)`. False where the response cannot go on: the provider is to end.
  template <class Append>
  bool put(Append&& append) {
    try {
      append(writer_.out());
      writer_.settle();
      return true;
    } catch (...) {
      problem_ = std::current_exception();
      return false;
    }
  }

  /// Throws what was thrown in put().
  void finish() const {
    if (problem_) std::rethrow_exception(problem_);
  }

 private:
  cimxml::ResponseWriter& writer_;
  std::exception_ptr problem_;
};

}  // namespace zorva::cimom
