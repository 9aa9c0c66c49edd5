#pragma once

// Shared by all function tables of the broker. Their functions are called from C: they must not throw. They answer a
// handle that is null, of the wrong kind or of another broker with CMPI_RC_ERR_INVALID_HANDLE.

#include <cxxabi.h>

#include <functional>
#include <memory>
#include <string_view>
#include <type_traits>

#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"

namespace zorva::broker {

inline constexpr int kTableVersion = CMPIVersion200;

/// A status whose message is made in the innermost scope of the thread; without a scope it has no message.
CMPIStatus statusOf(CMPIrc rc, std::string_view message = {}) noexcept;

inline void setStatus(CMPIStatus* status, CMPIrc rc) noexcept {
  if (status != nullptr) *status = {rc, nullptr};
}
inline void setStatus(CMPIStatus* status, CMPIrc rc, std::string_view message) noexcept {
  if (status != nullptr) *status = statusOf(rc, message);
}

/// Sets the status and returns an empty result: null, 0, or data without a value.
template <typename Result>
Result failed(CMPIStatus* status, CMPIrc rc, std::string_view message = {}) noexcept {
  setStatus(status, rc, message);
  if constexpr (std::is_same_v<Result, CMPIData>) {
    return CMPIData{CMPI_null, CMPI_badValue | CMPI_nullValue, {}};
  } else {
    return Result{};
  }
}

/// For functions whose object is null or of the wrong kind.
template <typename Result>
Result badHandle(CMPIStatus* status) noexcept {
  return failed<Result>(status, CMPI_RC_ERR_INVALID_HANDLE);
}

/// For functions that read one thing of their object: a member, or what a function returns of it.
template <typename Result, typename Object, typename Read>
Result readFrom(const Object* self, CMPIStatus* status, Read read) {
  if (self == nullptr) return badHandle<Result>(status);
  setStatus(status, CMPI_RC_OK);
  return static_cast<Result>(std::invoke(read, *self));
}

/// For functions that change their object.
template <typename Object, typename Change>
CMPIStatus change(Object* self, Change apply) {
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  apply(*self);
  return {CMPI_RC_OK, nullptr};
}

/// For functions that find nothing of that name or index.
inline CMPIData notFound(CMPIStatus* status, CMPIrc rc = CMPI_RC_ERR_NOT_FOUND) noexcept {
  setStatus(status, rc);
  return CMPIData{CMPI_null, CMPI_notFound | CMPI_nullValue, {}};
}

/// Brings the value of a new entry into the arena; `unnamed` is the error if it has no name.
inline CMPIStatus importEntry(Arena& arena, const char* name, const CMPIValue* value, CMPIType type, CMPIData& data,
                              const char* unnamed) {
  if (name == nullptr || *name == '\0') return statusOf(CMPI_RC_ERR_INVALID_PARAMETER, unnamed);
  return {importData(arena, value, type, data), nullptr};
}

/// The datum of that name, or at that index with its name.
inline CMPIData entryIn(const EntryList& list, const char* name, CMPIStatus* status) noexcept {
  const EntryList::Entry* entry = name != nullptr ? list.find(name) : nullptr;
  if (entry == nullptr) return notFound(status);
  setStatus(status, CMPI_RC_OK);
  return entry->data;
}
inline CMPIData entryIn(const EntryList& list, CMPICount index, CMPIString** name, CMPIStatus* status) noexcept {
  if (index >= list.size()) return notFound(status);
  if (name != nullptr) *name = list[index].name;
  setStatus(status, CMPI_RC_OK);
  return list[index].data;
}

/// The three readers of an object that is a list of entries.
template <typename Object>
CMPIData entryOf(const typename Object::Handle* handle, const char* name, CMPIStatus* status) {
  const Object* self = own<Object>(handle);
  return self != nullptr ? entryIn(self->list, name, status) : badHandle<CMPIData>(status);
}
template <typename Object>
CMPIData entryAt(const typename Object::Handle* handle, CMPICount index, CMPIString** name, CMPIStatus* status) {
  if (name != nullptr) *name = nullptr;
  const Object* self = own<Object>(handle);
  return self != nullptr ? entryIn(self->list, index, name, status) : badHandle<CMPIData>(status);
}
template <typename Object>
CMPICount entryCount(const typename Object::Handle* handle, CMPIStatus* status) {
  return readFrom<CMPICount>(own<Object>(handle), status, [](const Object& self) { return self.list.size(); });
}

namespace detail {

inline CMPIStatus* lastStatus() noexcept { return nullptr; }
template <typename First, typename... Rest>
CMPIStatus* lastStatus(First first, Rest... rest) noexcept {
  if constexpr (sizeof...(Rest) == 0 && std::is_same_v<First, CMPIStatus*>) {
    return first;
  } else {
    return lastStatus(rest...);
  }
}

template <auto function>
struct Guarded;

template <typename Result, typename... Args, Result (*function)(Args...)>
struct Guarded<function> {
  static Result call(Args... args) {
    try {
      return function(args...);
    } catch (const abi::__forced_unwind&) {
      throw;  // the thread is being cancelled: this must be rethrown
    } catch (...) {
      // This can only be std::bad_alloc.
      if constexpr (std::is_same_v<Result, CMPIStatus>) {
        return {CMPI_RC_ERR_FAILED, nullptr};
      } else if constexpr (!std::is_void_v<Result>) {
        return failed<Result>(lastStatus(args...), CMPI_RC_ERR_FAILED);
      }
    }
  }
};

}  // namespace detail

/// The function as it is entered in a table: an exception becomes CMPI_RC_ERR_FAILED.
template <auto function>
inline constexpr auto guarded = &detail::Guarded<function>::call;

/// `release` of every kind: frees an object that clone() made, and does nothing for all others.
template <typename Object>
CMPIStatus releaseObject(typename Object::Handle* handle) noexcept {
  Object* self = own<Object>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (self->arena != nullptr && self->arena->root() == self) delete self->arena;
  return {CMPI_RC_OK, nullptr};
}

/// `clone` of every kind: `copy(Arena&, const Object&)` makes the copy in its own arena.
template <typename Object, auto copy>
typename Object::Handle* cloneObject(const typename Object::Handle* handle, CMPIStatus* status) {
  const Object* self = own<Object>(handle);
  if (self == nullptr) return badHandle<typename Object::Handle*>(status);
  auto arena = std::make_unique<Arena>(self->arena != nullptr ? self->arena->classes() : nullptr, 256);
  Object* made = copy(*arena, *self);
  arena.release()->setRoot(made);
  setStatus(status, CMPI_RC_OK);
  return made;
}

/// The function table of a kind: its version, `release`, `clone`, and then these functions in the table's order.
template <typename Object, auto copy, auto... functions>
constexpr auto objectTable() {
  return decltype(Object::table){kTableVersion, releaseObject<Object>, guarded<cloneObject<Object, copy>>,
                                 guarded<functions>...};
}

}  // namespace zorva::broker
