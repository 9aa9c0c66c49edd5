#pragma once

#include <cxxabi.h>

#include <memory>
#include <string_view>
#include <type_traits>

#include "broker/objects/Objects.h"

// What all function tables of the broker share. Their functions are called from C: nothing may be thrown out of them,
// and each answers a handle that is null, of the wrong kind or foreign with CMPI_RC_ERR_INVALID_HANDLE.

namespace zorva::broker {

inline constexpr int kTableVersion = CMPIVersion200;

/// A status whose message is made in the innermost scope of the thread; without a scope it has none.
CMPIStatus statusOf(CMPIrc rc, std::string_view message = {}) noexcept;

inline void setStatus(CMPIStatus* status, CMPIrc rc) noexcept {
  if (status != nullptr) *status = {rc, nullptr};
}
inline void setStatus(CMPIStatus* status, CMPIrc rc, std::string_view message) noexcept {
  if (status != nullptr) *status = statusOf(rc, message);
}

/// Sets the status and gives an empty result: null, 0, or data without a value.
template <class Result>
Result failed(CMPIStatus* status, CMPIrc rc, std::string_view message = {}) noexcept {
  setStatus(status, rc, message);
  if constexpr (std::is_same_v<Result, CMPIData>) {
    return CMPIData{CMPI_null, CMPI_badValue | CMPI_nullValue, {}};
  } else {
    return Result{};
  }
}

/// For functions whose object is the null or wrong one.
template <class Result>
Result badHandle(CMPIStatus* status) noexcept {
  return failed<Result>(status, CMPI_RC_ERR_INVALID_HANDLE);
}

namespace detail {

inline CMPIStatus* lastStatus() noexcept { return nullptr; }
template <class First, class... Rest>
CMPIStatus* lastStatus(First first, Rest... rest) noexcept {
  if constexpr (sizeof...(Rest) == 0 && std::is_same_v<First, CMPIStatus*>) {
    return first;
  } else {
    return lastStatus(rest...);
  }
}

template <auto function>
struct Guarded;

template <class Result, class... Args, Result (*function)(Args...)>
struct Guarded<function> {
  static Result call(Args... args) {
    try {
      return function(args...);
    } catch (const abi::__forced_unwind&) {
      throw;  // the thread is being ended: this must go on
    } catch (...) {
      // Only memory can be short here.
      if constexpr (std::is_same_v<Result, CMPIStatus>) {
        return {CMPI_RC_ERR_FAILED, nullptr};
      } else if constexpr (!std::is_void_v<Result>) {
        return failed<Result>(lastStatus(args...), CMPI_RC_ERR_FAILED);
      }
    }
  }
};

}  // namespace detail

/// The function as it goes into a table: an exception within becomes CMPI_RC_ERR_FAILED.
template <auto function>
inline constexpr auto guarded = &detail::Guarded<function>::call;

/// `release` of every kind: ends an object that clone() made, and is harmless for all others.
template <class Object>
CMPIStatus releaseObject(typename Object::Handle* handle) noexcept {
  Object* self = own<Object>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (self->arena != nullptr && self->arena->root() == self) delete self->arena;
  return {CMPI_RC_OK, nullptr};
}

/// `clone` of every kind: `copy(Arena&, const Object&)` makes the copy in an arena of its own.
template <class Object, auto copy>
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
