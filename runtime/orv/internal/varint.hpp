// The sizes of varints.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>

namespace orv::inline v0::internal {

// How many bytes a varint takes: one for each seven bits up to the highest that is set. 9/64 is a seventh
// rounded up, and exact for up to 64 bits.
constexpr std::size_t varintSize(std::uint64_t value) {
  return (9 * static_cast<std::size_t>(std::bit_width(value | 1)) + 64) / 64;
}

// The varint of an enumeration's raw value: its low 32 bits, sign-extended.
constexpr std::uint64_t travellingValue(std::int64_t rawValue) {
  return static_cast<std::uint64_t>(std::int64_t{static_cast<std::int32_t>(rawValue)});
}

}  // namespace orv::internal
