#pragma once

// The operations of DSP0200 1.4. Each takes its parameters from a call, lets the broker or the schema do the work, and
// writes its response while the results arrive.

#include <exception>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "access/Audit.h"
#include "access/Role.h"
#include "broker/Broker.h"
#include "cimom/Pull.h"
#include "cimxml/ObjectWriter.h"
#include "cimxml/RequestReader.h"
#include "cimxml/ResponseWriter.h"
#include "util/ServiceHost.h"

namespace zorva::cimom {

/// The context of one operation. It lives as long as one call.
struct Operation {
  broker::Broker& broker;
  PullTable& pulls;
  cimxml::ObjectWriters& writers;
  const util::ServiceHost& host;
  const broker::Caller& caller;
  const cimxml::Call& call;
  cimxml::ResponseWriter& writer;
  const std::string& client;     ///< http::HttpRequest::client
  const access::ClientPtr& who;  ///< null: everything is allowed
  std::string_view hostHeader;   ///< as the client named this host
  std::string nameSpace;         ///< as the registry spells it
  access::AuditRecord& record;   ///< filled by an operation that changes something, or would

  const schema::ClassRepository& classes() const { return broker.classes(); }
};

/// Executes a call and writes the content of its response. If it fails, the caller must take back what was written, if
/// that is still possible; the `rc` is a CIM status code. Throws only std::bad_alloc and what the writer throws.
broker::Status carryOut(Operation& operation);

// Shared by the files of the operations.

using OperationFunction = broker::Status (*)(Operation& operation);

/// Nothing if the file has no operation of that name.
OperationFunction findInstanceOperation(std::string_view name) noexcept;
OperationFunction findAssociationOperation(std::string_view name) noexcept;
OperationFunction findClassOperation(std::string_view name) noexcept;
OperationFunction findPullOperation(std::string_view name) noexcept;
broker::Status invokeMethod(Operation& operation);

/// Brings the path into the form that the broker takes. It gets the call's namespace. A host that is this one is
/// removed, in references too. A key without a name gets its name. Missing keys are added if only one instance has the
/// given ones. A path of another host is CIM_ERR_INVALID_PARAMETER.
broker::Status canonicalizePath(const Operation& operation, broker::ObjectPath& path);
/// The same for the references in a value.
void canonicalizeValue(const Operation& operation, broker::Value& value);

/// Whether the client may read in the namespace of a result, which may be another one than the operation's.
bool mayRead(const Operation& operation, const broker::ObjectPath& result);

/// Notes which object the operation changes, or tries to.
void noteObject(const Operation& operation, const broker::ObjectPath& path);

/// Carries the writer's exceptions past a provider, which must not see them: write in put(), then call finish().
class Stream {
 public:
  explicit Stream(cimxml::ResponseWriter& writer) : writer_(writer) {}

  /// Runs `append(std::string&)`. False if the response cannot go on: the provider must end.
  template <typename Append>
  bool put(Append&& append) {
    try {
      append(writer_.out());
      writer_.drainIfFull();
      return true;
    } catch (...) {
      problem_ = std::current_exception();
      return false;
    }
  }

  /// Throws what put() caught.
  void finish() const {
    if (problem_) std::rethrow_exception(problem_);
  }

 private:
  cimxml::ResponseWriter& writer_;
  std::exception_ptr problem_;
};

}  // namespace zorva::cimom
