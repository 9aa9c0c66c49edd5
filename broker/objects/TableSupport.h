#pragma once

// Shared by all function tables of the broker. Their functions are called from C: they must not throw. They answer a
// handle that is null, of the wrong kind or of another broker with CMPI_RC_ERR_INVALID_HANDLE.

#include <cxxabi.h>

#include <memory>
#include <string_view>
#include <type_traits>

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

}  // namespace zorva::broker
