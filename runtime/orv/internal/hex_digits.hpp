// Numbers in hexadecimal digits.
#pragma once

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace orv::inline v0::internal {

inline constexpr std::string_view hexDigits = "0123456789abcdef";

// In lower-case digits, with leading zeros where it has fewer than `fewestDigits`.
inline std::string hexNumber(std::uint64_t number, std::size_t fewestDigits) {
  const std::size_t needed = (static_cast<std::size_t>(std::bit_width(number)) + 3) / 4;
  std::string text(std::max(needed, fewestDigits), '0');
  for (std::size_t at = text.size(); number != 0; number >>= 4) text[--at] = hexDigits[number & 0xF];
  return text;
}

}  // namespace orv::internal
