// Bytes by eights.
#pragma once

#include <cstdint>
#include <cstring>

namespace orv::internal {

// Eight bytes, which need not be aligned.
inline std::uint64_t wordAt(const void* bytes) {
  std::uint64_t word;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

// Set in each byte that is not ASCII.
inline constexpr std::uint64_t highBits = 0x8080808080808080;

}  // namespace orv::internal
