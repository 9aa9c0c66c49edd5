#pragma once

// The result of a function that its caller must expect to fail: the value or the error. Each folder has its own types
// of errors, which say what is wrong and where.

#include <tl/expected.hpp>
#include <type_traits>
#include <utility>

namespace zorva {

template <typename Value, typename Error>
using Expected = tl::expected<Value, Error>;

/// An error in the place of a value: `return unexpected(PathTextError{3, "no class"});`
template <typename Error>
tl::unexpected<std::decay_t<Error>> unexpected(Error&& error) {
  return tl::unexpected<std::decay_t<Error>>(std::forward<Error>(error));
}

}  // namespace zorva
