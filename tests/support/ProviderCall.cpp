#include "tests/support/ProviderCall.h"

#include <functional>
#include <utility>

namespace ZV::Test {

namespace {

const CMPIContext* contextOf(RecordingBroker& broker) { return broker.makeContext(); }

CMPIBoolean flag(bool value) { return static_cast<CMPIBoolean>(value); }

// Runs one operation with its own context, result and path, and collects the results.
template <typename Operation>
Outcome run(RecordingBroker& broker, const Path& path, const Operation& operation) {
  broker.beginRequest();
  const CMPIContext* context = contextOf(broker);
  const CMPIResult* result = broker.makeResult();
  const CMPIObjectPath* ref = broker.make(path, "ref");
  RecordingLogger* logger = RecordingLogger::active();
  const std::size_t linesBefore = logger == nullptr ? 0 : logger->size();

  const CMPIStatus status = operation(context, result, ref);

  Outcome outcome;
  outcome.rc = status.rc;
  if (status.msg != nullptr) outcome.message = RecordingBroker::read(status.msg);
  outcome.result = RecordingBroker::read(result);
  outcome.calls = broker.calls();
  if (logger != nullptr) outcome.lines = logger->linesSince(linesBefore).pairs();
  return outcome;
}

}  // namespace

const char* nameOf(CMPIrc rc) {
  switch (rc) {
    case CMPI_RC_OK:
      return "CMPI_RC_OK";
    case CMPI_RC_ERR_FAILED:
      return "CMPI_RC_ERR_FAILED";
    case CMPI_RC_ERR_INVALID_PARAMETER:
      return "CMPI_RC_ERR_INVALID_PARAMETER";
    case CMPI_RC_ERR_INVALID_CLASS:
      return "CMPI_RC_ERR_INVALID_CLASS";
    case CMPI_RC_ERR_NOT_FOUND:
      return "CMPI_RC_ERR_NOT_FOUND";
    case CMPI_RC_ERR_NOT_SUPPORTED:
      return "CMPI_RC_ERR_NOT_SUPPORTED";
    case CMPI_RC_ERR_NO_SUCH_PROPERTY:
      return "CMPI_RC_ERR_NO_SUCH_PROPERTY";
    case CMPI_RC_ERR_INVALID_HANDLE:
      return "CMPI_RC_ERR_INVALID_HANDLE";
    default:
      return "another rc";
  }
}

bool Outcome::markedEntry() const {
  return lines.size() >= 2 && lines[0].kind() == LineKind::Banner && lines[1].kind() == LineKind::Entering &&
         lines[1].function == "markProviderEntry";
}

bool Outcome::markedExit() const {
  for (std::size_t i = 0; i + 1 < lines.size(); ++i) {
    if (lines[i].kind() == LineKind::Exiting && lines[i].function == "markProviderExit" &&
        lines[i + 1].kind() == LineKind::Banner) {
      return true;
    }
  }
  return false;
}

std::vector<std::string> Outcome::story() const {
  std::vector<std::string> all;
  std::size_t line = 0;
  for (const RecordedCall& call : calls) {
    for (; line < lines.size() && lines[line].place < call.place; ++line) all.push_back("log " + lines[line].brief());
    if (!Calls{call}.steps().empty()) all.push_back(call.line);
  }
  for (; line < lines.size(); ++line) all.push_back("log " + lines[line].brief());
  return all;
}

std::ostream& operator<<(std::ostream& out, const Outcome& outcome) {
  out << nameOf(outcome.rc) << " (" << static_cast<int>(outcome.rc) << ")";
  if (outcome.message.has_value()) out << " " << inQuotes(*outcome.message);
  out << ", " << (outcome.done() ? "done" : "not done") << "\n";
  for (const Path& path : outcome.paths()) out << "path " << path << "\n";
  for (const Instance& instance : outcome.instances()) out << "instance " << instance;
  for (const Value& value : outcome.result.data) out << "data " << value << "\n";
  for (const std::string& step : outcome.story()) out << "  " << step << "\n";
  return out;
}

const char** PropertyList::cmpi() {
  if (!names_.has_value()) return nullptr;
  pointers_.clear();
  for (const std::string& name : *names_) pointers_.push_back(name.c_str());
  pointers_.push_back(nullptr);
  return pointers_.data();
}

InstanceProvider::InstanceProvider(Create create, RecordingBroker& broker)
    : broker_(broker), mi_(create(broker.cmpi(), contextOf(broker), nullptr)) {}

Outcome InstanceProvider::cleanup(bool terminating) {
  return run(broker_, Path(),
             [&](auto* context, auto*, auto*) { return mi_->ft->cleanup(mi_, context, flag(terminating)); });
}

Outcome InstanceProvider::enumerateInstanceNames(const Path& path) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->enumerateInstanceNames(mi_, context, result, ref);
  });
}

Outcome InstanceProvider::enumerateInstances(const Path& path, PropertyList properties) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->enumerateInstances(mi_, context, result, ref, properties.cmpi());
  });
}

Outcome InstanceProvider::getInstance(const Path& path, PropertyList properties) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->getInstance(mi_, context, result, ref, properties.cmpi());
  });
}

Outcome InstanceProvider::createInstance(const Path& path, const Instance& instance) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->createInstance(mi_, context, result, ref, broker_.make(instance));
  });
}

Outcome InstanceProvider::modifyInstance(const Path& path, const Instance& instance, PropertyList properties) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->modifyInstance(mi_, context, result, ref, broker_.make(instance), properties.cmpi());
  });
}

Outcome InstanceProvider::deleteInstance(const Path& path) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->deleteInstance(mi_, context, result, ref);
  });
}

Outcome InstanceProvider::execQuery(const Path& path, const char* query, const char* language) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->execQuery(mi_, context, result, ref, query, language);
  });
}

AssociationProvider::AssociationProvider(Create create, RecordingBroker& broker)
    : broker_(broker), mi_(create(broker.cmpi(), contextOf(broker), nullptr)) {}

Outcome AssociationProvider::cleanup(bool terminating) {
  return run(broker_, Path(),
             [&](auto* context, auto*, auto*) { return mi_->ft->cleanup(mi_, context, flag(terminating)); });
}

Outcome AssociationProvider::associators(const Path& path, AssociationQuery query) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->associators(mi_, context, result, ref, query.assocClass, query.resultClass, query.role,
                                query.resultRole, query.properties.cmpi());
  });
}

Outcome AssociationProvider::associatorNames(const Path& path, const AssociationQuery& query) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->associatorNames(mi_, context, result, ref, query.assocClass, query.resultClass, query.role,
                                    query.resultRole);
  });
}

Outcome AssociationProvider::references(const Path& path, AssociationQuery query) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->references(mi_, context, result, ref, query.resultClass, query.role, query.properties.cmpi());
  });
}

Outcome AssociationProvider::referenceNames(const Path& path, const AssociationQuery& query) {
  return run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->referenceNames(mi_, context, result, ref, query.resultClass, query.role);
  });
}

MethodProvider::MethodProvider(Create create, RecordingBroker& broker)
    : broker_(broker), mi_(create(broker.cmpi(), contextOf(broker), nullptr)) {}

Outcome MethodProvider::cleanup(bool terminating) {
  return run(broker_, Path(),
             [&](auto* context, auto*, auto*) { return mi_->ft->cleanup(mi_, context, flag(terminating)); });
}

Outcome MethodProvider::invokeMethod(const Path& path, const char* method, const std::vector<NamedValue>& arguments) {
  const CMPIArgs* in = broker_.makeArgs(arguments, "in");
  CMPIArgs* out = broker_.makeArgs({}, "out");
  Outcome outcome = run(broker_, path, [&](auto* context, auto* result, auto* ref) {
    return mi_->ft->invokeMethod(mi_, context, result, ref, method, in, out);
  });
  outcome.out = RecordingBroker::read(out);
  return outcome;
}

}  // namespace ZV::Test
