#pragma once

#include <cstdint>
#include <cstring>
#include <string_view>

namespace bench {

// Whether the bytes are well-formed UTF-8: no overlong forms, no surrogates, nothing beyond U+10FFFF.
// Sixteen bytes of ASCII are passed at a time.
inline bool isWellFormedUtf8(std::string_view text) {
  constexpr std::uint64_t highBits = 0x8080808080808080u;
  const auto* at = reinterpret_cast<const unsigned char*>(text.data());
  const auto* const end = at + text.size();
  const auto continues = [&](int offset) { return (at[offset] & 0xC0) == 0x80; };
  while (at != end) {
    for (std::uint64_t words[2]; end - at >= 16; at += 16) {
      std::memcpy(words, at, 16);
      if ((words[0] | words[1]) & highBits) break;
    }
    if (at == end) return true;
    if (*at < 0x80) {
      ++at;
    } else if (*at < 0xE0) {
      if (*at < 0xC2 || end - at < 2 || !continues(1)) return false;
      at += 2;
    } else if (*at < 0xF0) {
      if (end - at < 3 || !continues(1) || !continues(2)) return false;
      if ((*at == 0xE0 && at[1] < 0xA0) || (*at == 0xED && at[1] > 0x9F)) return false;
      at += 3;
    } else {
      if (*at > 0xF4 || end - at < 4 || !continues(1) || !continues(2) || !continues(3)) return false;
      if ((*at == 0xF0 && at[1] < 0x90) || (*at == 0xF4 && at[1] > 0x8F)) return false;
      at += 4;
    }
  }
  return true;
}

}  // namespace bench
