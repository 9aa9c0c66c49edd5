#pragma once

#include <cstdint>

namespace zorva::http {

/// What a listening socket speaks.
enum class Door : std::uint8_t { Http, Https };

}  // namespace zorva::http
