#pragma once

// Numbers in CMPI data, by the data's type.

#include <cmpidt.h>

#include <cstdint>
#include <limits>

namespace zorva::broker {

constexpr bool isUnsignedType(CMPIType type) noexcept {
  return type == CMPI_uint8 || type == CMPI_uint16 || type == CMPI_uint32 || type == CMPI_uint64;
}
constexpr bool isSignedType(CMPIType type) noexcept {
  return type == CMPI_sint8 || type == CMPI_sint16 || type == CMPI_sint32 || type == CMPI_sint64;
}
constexpr bool isRealType(CMPIType type) noexcept { return type == CMPI_real32 || type == CMPI_real64; }

/// The number in `data`, whose type is an unsigned one.
inline std::uint64_t unsignedOf(const CMPIData& data) noexcept {
  switch (data.type) {
    case CMPI_uint8:
      return data.value.uint8;
    case CMPI_uint16:
      return data.value.uint16;
    case CMPI_uint32:
      return data.value.uint32;
    default:
      return data.value.uint64;
  }
}

/// The number in `data`, whose type is a signed one.
inline std::int64_t signedOf(const CMPIData& data) noexcept {
  switch (data.type) {
    case CMPI_sint8:
      return data.value.sint8;
    case CMPI_sint16:
      return data.value.sint16;
    case CMPI_sint32:
      return data.value.sint32;
    default:
      return data.value.sint64;
  }
}

template <typename Narrow, typename Wide>
bool placeNumber(Narrow& member, Wide number) noexcept {
  member = static_cast<Narrow>(number);
  return static_cast<Wide>(member) == number;
}

/// Puts a number into `data` by its type, which is an unsigned one. False if it does not fit.
inline bool placeUnsigned(CMPIData& data, std::uint64_t number) noexcept {
  switch (data.type) {
    case CMPI_uint8:
      return placeNumber(data.value.uint8, number);
    case CMPI_uint16:
      return placeNumber(data.value.uint16, number);
    case CMPI_uint32:
      return placeNumber(data.value.uint32, number);
    case CMPI_uint64:
      return placeNumber(data.value.uint64, number);
    default:
      return false;
  }
}

/// The same for the signed types.
inline bool placeSigned(CMPIData& data, std::int64_t number) noexcept {
  switch (data.type) {
    case CMPI_sint8:
      return placeNumber(data.value.sint8, number);
    case CMPI_sint16:
      return placeNumber(data.value.sint16, number);
    case CMPI_sint32:
      return placeNumber(data.value.sint32, number);
    case CMPI_sint64:
      return placeNumber(data.value.sint64, number);
    default:
      return false;
  }
}

/// The same for the real types. A number for a 32-bit one is rounded, and refused if it is out of range.
inline bool placeReal(CMPIData& data, double number) noexcept {
  if (data.type == CMPI_real64) {
    data.value.real64 = number;
    return true;
  }
  const double most = std::numeric_limits<float>::max();
  if (data.type != CMPI_real32 || (number > most && number <= std::numeric_limits<double>::max()) ||
      (number < -most && number >= -std::numeric_limits<double>::max())) {
    return false;
  }
  data.value.real32 = static_cast<float>(number);
  return true;
}

}  // namespace zorva::broker
