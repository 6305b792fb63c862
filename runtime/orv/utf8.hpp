// Checking and reading UTF-8, as Unicode 15.0 defines it in section 3.9 (D92, table 3-7): no surrogates, no
// overlong forms, nothing above U+10FFFF.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include <orv/internal/inline_bytes.hpp>

namespace orv::inline v0::utf8 {

// What stands at the start of a text: a code point, or the longest start of an ill-formed one.
struct Step {
  char32_t codePoint;   // meaningless when ill-formed
  std::uint8_t length;  // bytes taken, at least 1; for an ill-formed part the maximal subpart of D93b
  bool isWellFormed;
};

// `text` is not empty.
Step step(std::string_view text) noexcept;

// How many bytes at the start of `text` are well-formed.
std::size_t wellFormedPrefix(std::string_view text) noexcept;

// Checks eight bytes at a time.
inline bool isAscii(std::string_view text) {
  const std::size_t size = text.size();
  const char* const bytes = text.data();
  if (size < 8) {
    unsigned char bits = 0;
    for (const char c : text) bits = static_cast<unsigned char>(bits | static_cast<unsigned char>(c));
    return bits < 0x80;
  }
  // The last word overlaps the one before it, so no byte is left over.
  std::uint64_t bits = internal::wordAt(bytes + size - 8);
  std::size_t at = 0;
  for (; at + 32 <= size; at += 32) {
    bits |= internal::wordAt(bytes + at) | internal::wordAt(bytes + at + 8) |
            internal::wordAt(bytes + at + 16) | internal::wordAt(bytes + at + 24);
    if ((bits & internal::highBits) != 0) return false;
  }
  for (; at + 8 <= size; at += 8) bits |= internal::wordAt(bytes + at);
  return (bits & internal::highBits) == 0;
}

// Whether the first `size` bytes, which fit inside a text, are well-formed, of InlineBytes::objectSize that may be
// read.
bool isWellFormedWithin(const std::byte* bytes, std::size_t size) noexcept;

inline bool isWellFormed(std::string_view text) { return wellFormedPrefix(text) == text.size(); }

}  // namespace orv::utf8
