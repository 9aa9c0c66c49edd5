#pragma once

// The CMPI objects of this broker. Each begins with the handle that CMPI publishes (hdl, ft), hdl pointing at the
// object itself. A handle of ours is recognized by its function table: own<InstanceObject>(handle) is the object of the
// handle, or null if the handle is null, of another kind, or another broker's.
//
// Objects live in an arena and have no destructor. Texts and date-times are immutable, so objects of one arena share
// them. All others are copied when they become part of another object. A null arena pointer marks an object that lives
// as long as the broker.

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "broker/objects/Arena.h"
#include "util/NotCopied.h"

namespace zorva::schema {
struct ClassProperty;
}

namespace zorva::broker {

class ClassInfo;

struct StringObject : CMPIString, private util::NotCopied {
  using Handle = CMPIString;
  static CMPIStringFT table;

  /// `text` is ended by a NUL and lives as long as the object.
  StringObject(Arena* owner, std::string_view text) noexcept
      : CMPIString{this, &table}, arena(owner), chars(text.data()), length(text.size()) {}

  static StringObject* make(Arena& arena, std::string_view text);
  std::string_view view() const noexcept { return {chars, length}; }

  Arena* arena;
  const char* chars;
  std::size_t length;
};

/// The empty text, for a text that is not set.
StringObject& emptyString() noexcept;

/// A text object with that content. Reuses one of the last few if it has the same content.
StringObject* intern(Arena& arena, std::string_view text);

/// A property as declared in a class.
struct PropertyInfo {
  const schema::ClassProperty* declared;
  StringObject* name;   ///< lives as long as the table
  CMPIType type;        ///< with CMPI_ARRAY where it is an array
  std::uint16_t index;  ///< in ClassInfo::properties()
  bool isKey;
  bool takesInstance;  ///< declared as a string with EmbeddedInstance or EmbeddedObject
};

struct ArrayObject : CMPIArray, private util::NotCopied {
  using Handle = CMPIArray;
  static CMPIArrayFT table;

  ArrayObject(Arena& owner, CMPIType elementType, CMPICount size);

  Arena* arena;
  CMPIType type;  ///< of the elements; CMPI_string also if it was made for CMPI_chars
  CMPICount count;
  CMPIData* elements;
};

/// A point in time or an interval (DSP0004 5.2.4).
struct DateTimeObject : CMPIDateTime, private util::NotCopied {
  using Handle = CMPIDateTime;
  static CMPIDateTimeFT table;

  DateTimeObject(Arena& owner, StringObject* as25Characters, std::uint64_t asMicroseconds, bool isInterval) noexcept
      : CMPIDateTime{this, &table},
        arena(&owner),
        text(as25Characters),
        microseconds(asMicroseconds),
        interval(isInterval) {}

  /// Null if `text` is no date-time.
  static DateTimeObject* make(Arena& arena, std::string_view text);

  Arena* arena;
  StringObject* text;
  std::uint64_t microseconds;  ///< since 1970 in UTC, or of the interval
  bool interval;
};

/// Named data in the order of insertion: keys, arguments, context entries.
class EntryList {
 public:
  struct Entry {
    StringObject* name;
    CMPIData data;
  };

  const Entry* find(std::string_view name) const noexcept;
  /// Shares the entries of a list of the same arena without copying them. The list that is changed first gets its own
  /// copy.
  void share(const EntryList& other) noexcept;
  /// Sets the entry of that name, or appends one.
  void set(Arena& arena, StringObject* name, const CMPIData& data);
  void append(Arena& arena, StringObject* name, const CMPIData& data);
  void reserve(Arena& arena, std::uint32_t capacity);

  std::uint32_t size() const noexcept { return size_; }
  const Entry& operator[](std::uint32_t index) const noexcept { return entries_[index]; }
  const Entry* begin() const noexcept { return entries_; }
  const Entry* end() const noexcept { return entries_ + size_; }

 private:
  /// Gives the list its own array.
  void moveTo(Arena& arena, std::uint32_t capacity);

  Entry* entries_ = nullptr;
  std::uint32_t size_ = 0;
  std::uint32_t capacity_ = 0;
  mutable bool shared_ = false;  ///< another list may have the same entries
};

struct PathObject : CMPIObjectPath, private util::NotCopied {
  using Handle = CMPIObjectPath;
  static CMPIObjectPathFT table;

  explicit PathObject(Arena& owner) noexcept
      : CMPIObjectPath{this, &table},
        arena(&owner),
        nameSpace(&emptyString()),
        host(&emptyString()),
        className(&emptyString()) {}

  static PathObject* make(Arena& arena, std::string_view nameSpace, std::string_view className);

  /// Takes the schema's spelling if the schema has the class.
  void setClass(std::string_view name);
  void setClass(const ClassInfo& known) noexcept;
  void setNameSpace(std::string_view name);
  void setHost(std::string_view name);

  Arena* arena;
  const ClassInfo* info = nullptr;  ///< null if the schema does not have the class
  StringObject* nameSpace;
  StringObject* host;
  StringObject* className;
  EntryList keys;
};

struct InstanceObject : CMPIInstance, private util::NotCopied {
  using Handle = CMPIInstance;
  static CMPIInstanceFT table;

  /// A property that is set.
  struct Slot {
    const PropertyInfo* property;
    CMPIData data;
  };

  InstanceObject(Arena& owner, const ClassInfo& known) noexcept
      : CMPIInstance{this, &table}, arena(&owner), info(&known), nameSpace(&emptyString()), host(&emptyString()) {}

  /// An instance of the path's class, in its namespace, with its keys as properties. The schema must have the class.
  static InstanceObject* make(Arena& arena, const PathObject& path);

  const Slot* find(const PropertyInfo& property) const noexcept;
  /// Sets it even if the filter excludes it. `data` lives in this object's arena.
  void set(const PropertyInfo& property, const CMPIData& data);
  bool passes(const PropertyInfo& property) const noexcept {
    return filter == nullptr || (filter[property.index / 64] >> (property.index % 64) & 1U) != 0;
  }
  /// The name of this instance, made in `into`: namespace, host, and the keys that are set.
  PathObject* path(Arena& into) const;

  Arena* arena;
  const ClassInfo* info;
  StringObject* nameSpace;
  StringObject* host;
  Slot* slots = nullptr;
  std::uint32_t count = 0;
  std::uint32_t capacity = 0;
  std::uint64_t present = 0;             ///< a bit for each set property, by its index modulo 64
  std::uint64_t* filter = nullptr;       ///< a bit for each property that may be set; null: all
  const EntryList* looseKeys = nullptr;  ///< if the class has no key properties: the keys of the path it was made from
};

struct ArgsObject : CMPIArgs, private util::NotCopied {
  using Handle = CMPIArgs;
  static CMPIArgsFT table;

  explicit ArgsObject(Arena& owner) noexcept : CMPIArgs{this, &table}, arena(&owner) {}

  Arena* arena;
  EntryList list;
};

/// The result of an enumerating up-call.
struct EnumerationObject : CMPIEnumeration, private util::NotCopied {
  using Handle = CMPIEnumeration;
  static CMPIEnumerationFT table;

  EnumerationObject(Arena& owner, CMPIType elementType) noexcept
      : CMPIEnumeration{this, &table}, arena(&owner), type(elementType) {}

  /// `data` lives in this object's arena.
  void append(const CMPIData& data);

  Arena* arena;
  CMPIType type;  ///< CMPI_instance or CMPI_ref
  CMPIData* elements = nullptr;
  std::uint32_t count = 0;
  std::uint32_t capacity = 0;
  std::uint32_t position = 0;  ///< of the next element
};

struct ContextObject : CMPIContext, private util::NotCopied {
  using Handle = CMPIContext;
  static CMPIContextFT table;

  explicit ContextObject(Arena& owner) noexcept : CMPIContext{this, &table}, arena(&owner) {}

  void setText(const char* name, std::string_view text);
  void setFlags(CMPIFlags flags);

  Arena* arena;
  EntryList list;
};

/// An error as the class CIM_Error describes it.
struct ErrorObject : CMPIError, private util::NotCopied {
  using Handle = CMPIError;
  static CMPIErrorFT table;

  explicit ErrorObject(Arena& owner) noexcept : CMPIError{this, &table}, arena(&owner) {}

  /// All members that are neither texts nor arrays.
  struct Codes {
    CMPIErrorType type = UnknownErrorType;
    CMPIErrorSeverity severity = ErrorSevUnknown;
    CMPIErrorProbableCause cause = ErrorProbCauseUnknown;
    CMPIErrorSrcFormat sourceFormat = CMPIErrSrcUnknown;
    CMPIrc status = CMPI_RC_ERR_FAILED;
  };

  Arena* arena;
  Codes codes;
  StringObject* otherType = nullptr;  ///< null texts and arrays: not set
  StringObject* owningEntity = nullptr;
  StringObject* messageId = nullptr;
  StringObject* message = nullptr;
  StringObject* causeDescription = nullptr;
  StringObject* source = nullptr;
  StringObject* otherSourceFormat = nullptr;
  StringObject* statusDescription = nullptr;
  ArrayObject* actions = nullptr;
  ArrayObject* arguments = nullptr;
};

/// True where `table` is the function table of one of this broker's objects.
bool isOwnTable(const void* table) noexcept;

/// "CMPIInstance" and so on; null if `object` belongs to another broker.
const char* typeNameOf(const void* object) noexcept;

/// The object of a handle of this broker, else null. Constness is dropped: CMPI's own setters take const handles.
template <typename Object>
Object* own(const typename Object::Handle* handle) noexcept {
  if (handle == nullptr || handle->ft != &Object::table || handle->hdl == nullptr) return nullptr;
  return const_cast<Object*>(static_cast<const Object*>(handle));
}

/// True for a handle that another broker in the process made: it is used through its own table.
template <typename Handle>
bool isForeign(const Handle* handle) noexcept {
  return handle != nullptr && handle->hdl != nullptr && handle->ft != nullptr && !isOwnTable(handle->ft);
}

/// The function table of all results; it marks a handle as a result.
extern CMPIResultFT resultTable;

}  // namespace zorva::broker
