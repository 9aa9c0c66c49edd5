// CMPIBrokerEncFT: makes objects in the innermost scope of the thread, names them, shows them as text, and handles
// messages and the log.

#include <chrono>
#include <cstdarg>
#include <string>

#include "broker/core/BrokerCore.h"
#include "broker/objects/ClassTable.h"
#include "broker/objects/Data.h"
#include "broker/objects/DateTimeText.h"
#include "broker/objects/ObjectText.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

/// The arena in which a call makes its object. On a thread without a scope the call fails: the object would never be
/// freed.
Arena* arenaFor(const CMPIBroker* broker, CMPIStatus* status) noexcept {
  if (BrokerCore::of(broker) == nullptr) {
    setStatus(status, CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
  }
  Arena* arena = currentArena();
  setStatus(status, arena != nullptr ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
  return arena;
}

CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  const PathObject* name = readPath(*arena, path);
  if (name == nullptr) return badHandle<CMPIInstance*>(status);
  if (name->info == nullptr) {
    return failed<CMPIInstance*>(status, CMPI_RC_ERR_INVALID_CLASS,
                                 "there is no class " + std::string(name->className->view()));
  }
  return InstanceObject::make(*arena, *name);
}

CMPIObjectPath* newObjectPath(const CMPIBroker* broker, const char* nameSpace, const char* className,
                              CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  return PathObject::make(*arena, nameSpace != nullptr ? nameSpace : "", className != nullptr ? className : "");
}

CMPIArgs* newArgs(const CMPIBroker* broker, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  return arena != nullptr ? arena->make<ArgsObject>(*arena) : nullptr;
}

CMPIString* newString(const CMPIBroker* broker, const char* text, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  return arena != nullptr ? StringObject::make(*arena, text != nullptr ? text : "") : nullptr;
}

CMPIArray* newArray(const CMPIBroker* broker, CMPICount size, CMPIType type, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
  if (keptType(element) == CMPI_null) return failed<CMPIArray*>(status, CMPI_RC_ERR_INVALID_DATA_TYPE);
  return arena->make<ArrayObject>(*arena, element, size);
}

CMPIDateTime* dateTimeOf(Arena& arena, const DateTimeValue& value, CMPIStatus* status) {
  const std::optional<std::string> text = dateTimeText(value);
  if (!text) return failed<CMPIDateTime*>(status, CMPI_RC_ERR_INVALID_PARAMETER, "past what 25 characters can say");
  return arena.make<DateTimeObject>(arena, StringObject::make(arena, *text), value.microseconds, value.interval);
}

CMPIDateTime* newDateTime(const CMPIBroker* broker, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  const auto now =
      std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::system_clock::now().time_since_epoch());
  return dateTimeOf(*arena, {static_cast<std::uint64_t>(now.count()), false}, status);
}

CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* broker, CMPIUint64 microseconds, CMPIBoolean interval,
                                    CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  return arena != nullptr ? dateTimeOf(*arena, {microseconds, interval != 0}, status) : nullptr;
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* broker, const char* text, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  DateTimeObject* made = text != nullptr ? DateTimeObject::make(*arena, text) : nullptr;
  if (made == nullptr) setStatus(status, CMPI_RC_ERR_INVALID_PARAMETER, "no CIM date-time of 25 characters");
  return made;
}

CMPISelectExp* newSelectExp(const CMPIBroker* broker, const char* /*query*/, const char* /*language*/,
                            CMPIArray** projection, CMPIStatus* status) {
  if (projection != nullptr) *projection = nullptr;
  const bool good = BrokerCore::of(broker) != nullptr;
  return failed<CMPISelectExp*>(status, good ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIBoolean classPathIsA(const CMPIBroker* broker, const CMPIObjectPath* path, const char* type, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  const PathObject* name = arena != nullptr ? readPath(*arena, path) : own<PathObject>(path);
  const BrokerCore* core = BrokerCore::of(broker);
  if (core == nullptr || name == nullptr) return badHandle<CMPIBoolean>(status);
  if (type == nullptr) return failed<CMPIBoolean>(status, CMPI_RC_ERR_INVALID_PARAMETER);
  setStatus(status, CMPI_RC_OK);
  return name->info != nullptr && name->info->declared().isA(type) ? 1 : 0;
}

CMPIString* toString(const CMPIBroker* broker, const void* object, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  if (typeNameOf(object) == nullptr) return badHandle<CMPIString*>(status);
  return StringObject::make(*arena, objectText(object));
}

CMPIBoolean isOfType(const CMPIBroker* broker, const void* object, const char* type, CMPIStatus* status) {
  const char* name = typeNameOf(object);
  if (BrokerCore::of(broker) == nullptr || name == nullptr) return badHandle<CMPIBoolean>(status);
  if (type == nullptr) return failed<CMPIBoolean>(status, CMPI_RC_ERR_INVALID_PARAMETER);
  setStatus(status, CMPI_RC_OK);
  return std::string_view(name) == type ? 1 : 0;
}

CMPIString* getType(const CMPIBroker* broker, const void* object, CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  const char* name = typeNameOf(object);
  return name != nullptr ? StringObject::make(*arena, name) : badHandle<CMPIString*>(status);
}

/// The inserts of a message, each a type and a value as CMFmtArgs writes them.
std::vector<std::string> inserts(CMPICount count, va_list arguments) {
  std::vector<std::string> texts;
  // Placeholders go up to ten; a wrong count must not be trusted.
  for (CMPICount i = 0; i < count && i < 10; ++i) {
    switch (va_arg(arguments, int)) {
      case CMPI_sint32:
        texts.push_back(std::to_string(va_arg(arguments, long)));
        break;
      case CMPI_uint32:
        texts.push_back(std::to_string(va_arg(arguments, unsigned long)));
        break;
      case CMPI_sint64:
        texts.push_back(std::to_string(va_arg(arguments, long long)));
        break;
      case CMPI_uint64:
        texts.push_back(std::to_string(va_arg(arguments, unsigned long long)));
        break;
      case CMPI_real64:
        texts.push_back(std::to_string(va_arg(arguments, double)));
        break;
      case CMPI_boolean:
        texts.emplace_back(va_arg(arguments, int) != 0 ? "true" : "false");
        break;
      case CMPI_chars: {
        const char* text = va_arg(arguments, const char*);
        texts.emplace_back(text != nullptr ? text : "");
        break;
      }
      case CMPI_string:
        texts.emplace_back(textOf(va_arg(arguments, const CMPIString*)));
        break;
      default:
        return texts;  // the size of this value is unknown, so the following ones cannot be read
    }
  }
  return texts;
}

/// `pattern` with {0} to {9} replaced.
std::string composed(std::string_view pattern, const std::vector<std::string>& texts) {
  std::string message;
  for (std::size_t i = 0; i < pattern.size(); ++i) {
    const bool placeholder = pattern[i] == '{' && i + 2 < pattern.size() && pattern[i + 2] == '}' &&
                             pattern[i + 1] >= '0' && pattern[i + 1] <= '9' &&
                             static_cast<std::size_t>(pattern[i + 1] - '0') < texts.size();
    if (!placeholder) {
      message += pattern[i];
      continue;
    }
    message += texts[static_cast<std::size_t>(pattern[i + 1] - '0')];
    i += 2;
  }
  return message;
}

CMPIString* messageOf(const CMPIBroker* broker, const char* pattern, CMPIStatus* status, CMPICount count,
                      va_list arguments) noexcept {
  try {
    Arena* arena = arenaFor(broker, status);
    if (arena == nullptr) return nullptr;
    return StringObject::make(*arena, composed(pattern != nullptr ? pattern : "", inserts(count, arguments)));
  } catch (const std::bad_alloc&) {
    return failed<CMPIString*>(status, CMPI_RC_ERR_FAILED);
  }
}

// There are no translations: every message has its default text.
// NOLINTNEXTLINE(cert-dcl50-cpp): the standard's signature
CMPIString* getMessage(const CMPIBroker* broker, const char* /*id*/, const char* defaultText, CMPIStatus* status,
                       CMPICount count, ...) {
  va_list arguments;
  va_start(arguments, count);
  CMPIString* message = messageOf(broker, defaultText, status, count, arguments);
  va_end(arguments);
  return message;
}

// NOLINTNEXTLINE(cert-dcl50-cpp): the standard's signature
CMPIString* getMessage2(const CMPIBroker* broker, const char* /*id*/, CMPIMsgFileHandle file, const char* defaultText,
                        CMPIStatus* status, CMPICount count, ...) {
  // openMessageFile returns only null handles.
  if (file != nullptr) return badHandle<CMPIString*>(status);
  va_list arguments;
  va_start(arguments, count);
  CMPIString* message = messageOf(broker, defaultText, status, count, arguments);
  va_end(arguments);
  return message;
}

CMPIStatus openMessageFile(const CMPIBroker* broker, const char* name, CMPIMsgFileHandle* file) {
  if (file != nullptr) *file = nullptr;
  if (BrokerCore::of(broker) == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  return {name != nullptr && file != nullptr ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_PARAMETER, nullptr};
}

CMPIStatus closeMessageFile(const CMPIBroker* broker, CMPIMsgFileHandle file) {
  const bool good = BrokerCore::of(broker) != nullptr && file == nullptr;
  return {good ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE, nullptr};
}

CMPIStatus writeLog(const CMPIBroker* broker, LogLevel level, const char* id, const char* text,
                    const CMPIString* string) {
  const BrokerCore* core = BrokerCore::of(broker);
  if (core == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  std::string line = id != nullptr ? std::string(id) + ": " : std::string();
  if (text != nullptr) {
    line += text;
  } else if (string != nullptr) {
    line += textOf(string);
  } else {
    return {CMPI_RC_ERR_INVALID_PARAMETER, nullptr};
  }
  core->log(level, line);
  return {CMPI_RC_OK, nullptr};
}

CMPIStatus logMessage(const CMPIBroker* broker, int severity, const char* id, const char* text,
                      const CMPIString* string) {
  switch (severity) {
    case CMPI_SEV_ERROR:
      return writeLog(broker, LogLevel::Error, id, text, string);
    case CMPI_SEV_WARNING:
      return writeLog(broker, LogLevel::Warning, id, text, string);
    case CMPI_SEV_INFO:
      return writeLog(broker, LogLevel::Info, id, text, string);
    default:
      return writeLog(broker, LogLevel::Debug, id, text, string);
  }
}

CMPIStatus trace(const CMPIBroker* broker, int /*level*/, const char* component, const char* text,
                 const CMPIString* string) {
  return writeLog(broker, LogLevel::Debug, component, text, string);
}

StringObject* textOrNone(Arena& arena, const char* text) {
  return text != nullptr ? StringObject::make(arena, text) : nullptr;
}

CMPIError* newCMPIError(const CMPIBroker* broker, const char* owner, const char* messageId, const char* message,
                        const CMPIErrorSeverity severity, const CMPIErrorProbableCause cause, const CMPIrc code,
                        CMPIStatus* status) {
  Arena* arena = arenaFor(broker, status);
  if (arena == nullptr) return nullptr;
  auto* error = arena->make<ErrorObject>(*arena);
  error->owningEntity = textOrNone(*arena, owner);
  error->messageId = textOrNone(*arena, messageId);
  error->message = textOrNone(*arena, message);
  error->codes.severity = severity;
  error->codes.cause = cause;
  error->codes.status = code;
  return error;
}

}  // namespace

CMPIBrokerEncFT encapsulationTable = {
    kTableVersion,
    guarded<newInstance>,
    guarded<newObjectPath>,
    guarded<newArgs>,
    guarded<newString>,
    guarded<newArray>,
    guarded<newDateTime>,
    guarded<newDateTimeFromBinary>,
    guarded<newDateTimeFromChars>,
    guarded<newSelectExp>,
    guarded<classPathIsA>,
    guarded<toString>,
    guarded<isOfType>,
    guarded<getType>,
    getMessage,
    guarded<logMessage>,
    guarded<trace>,
    guarded<newCMPIError>,
    guarded<openMessageFile>,
    guarded<closeMessageFile>,
    getMessage2,
};

}  // namespace zorva::broker
