// Checking and reading UTF-8, as Unicode 15.0 defines it in section 3.9 (D92, table 3-7): no surrogates, no
// overlong forms, nothing above U+10FFFF.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace orv::utf8 {

// What stands at the start of a text: a code point, or the longest start of an ill-formed one.
struct Step {
  char32_t codePoint;   // meaningless when ill-formed
  std::uint8_t length;  // bytes taken, at least 1; for an ill-formed part the maximal subpart of D93b
  bool isWellFormed;
};

// `text` is not empty.
Step step(std::string_view text);

// How many bytes at the start of `text` are well-formed.
std::size_t wellFormedPrefix(std::string_view text);

// Bytes of which this bit is set are not ASCII, in each byte of a word.
inline constexpr std::uint64_t highBits = 0x8080808080808080;

inline std::uint64_t wordAt(const char* bytes) {
  std::uint64_t word;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

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
  std::uint64_t bits = wordAt(bytes + size - 8);
  std::size_t at = 0;
  for (; at + 32 <= size; at += 32) {
    bits |= wordAt(bytes + at) | wordAt(bytes + at + 8) | wordAt(bytes + at + 16) | wordAt(bytes + at + 24);
    if ((bits & highBits) != 0) return false;
  }
  for (; at + 8 <= size; at += 8) bits |= wordAt(bytes + at);
  return (bits & highBits) == 0;
}

inline bool isWellFormed(std::string_view text) { return wellFormedPrefix(text) == text.size(); }

// Appends the UTF-8 form of a code point to anything with push_back.
template <class Output>
void append(char32_t codePoint, Output& output) {
  const auto put = [&](char32_t byte) { output.push_back(static_cast<char>(byte)); };
  if (codePoint < 0x80) {
    put(codePoint);
  } else if (codePoint < 0x800) {
    put(0xC0 | (codePoint >> 6));
    put(0x80 | (codePoint & 0x3F));
  } else if (codePoint < 0x10000) {
    put(0xE0 | (codePoint >> 12));
    put(0x80 | ((codePoint >> 6) & 0x3F));
    put(0x80 | (codePoint & 0x3F));
  } else {
    put(0xF0 | (codePoint >> 18));
    put(0x80 | ((codePoint >> 12) & 0x3F));
    put(0x80 | ((codePoint >> 6) & 0x3F));
    put(0x80 | (codePoint & 0x3F));
  }
}

}  // namespace orv::utf8
