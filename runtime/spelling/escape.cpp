#include <orv/spelling/escape.hpp>

#include <cstdint>

namespace orv::inline v0::spelling {

namespace {

struct Number {
  std::uint32_t value = 0;
  std::size_t digits = 0;
};

// Up to so many digits at the start of the text.
Number takeNumber(std::string_view text, std::uint32_t base, std::size_t mostDigits) {
  Number number;
  for (const char character : text.substr(0, mostDigits)) {
    const int digit = digitValue(character);
    if (digit < 0 || static_cast<std::uint32_t>(digit) >= base) break;
    number.value = number.value * base + static_cast<std::uint32_t>(digit);
    ++number.digits;
  }
  return number;
}

void appendUtf8(std::uint32_t codePoint, std::string& bytes) {
  const auto add = [&](std::uint32_t byte) { bytes += static_cast<char>(byte); };
  const auto addTail = [&](int shift) { add(0x80 | (codePoint >> shift & 0x3F)); };
  if (codePoint < 0x80) return add(codePoint);
  if (codePoint < 0x800) {
    add(0xC0 | codePoint >> 6);
  } else if (codePoint < 0x10000) {
    add(0xE0 | codePoint >> 12);
    addTail(6);
  } else {
    add(0xF0 | codePoint >> 18);
    addTail(12);
    addTail(6);
  }
  addTail(0);
}

// \uD83D\uDE00 is one code point. A half without the other stays ill-formed.
std::size_t takeShortCodePoint(std::string_view text, std::string& bytes) {
  constexpr std::size_t length = 6;
  const Number first = takeNumber(text.substr(2), 16, 4);
  if (first.digits != 4) return 0;
  if (first.value >= 0xD800 && first.value < 0xDC00 && text.substr(length).starts_with("\\u")) {
    const Number second = takeNumber(text.substr(length + 2), 16, 4);
    if (second.digits == 4 && second.value >= 0xDC00 && second.value < 0xE000) {
      appendUtf8(0x10000 + ((first.value - 0xD800) << 10) + (second.value - 0xDC00), bytes);
      return 2 * length;
    }
  }
  appendUtf8(first.value, bytes);
  return length;
}

}  // namespace

std::size_t takeEscape(std::string_view text, std::string& bytes) {
  constexpr std::string_view letters = "abfnrtv\\?'\"";
  constexpr std::string_view meanings = "\a\b\f\n\r\t\v\\?'\"";
  if (text.size() < 2) return 0;
  const char kind = text[1];
  if (const auto known = letters.find(kind); known != std::string_view::npos) {
    bytes += meanings[known];
    return 2;
  }
  if (kind == 'u') return takeShortCodePoint(text, bytes);
  if (kind == 'U') {
    const Number codePoint = takeNumber(text.substr(2), 16, 8);
    if (codePoint.digits != 8 || codePoint.value > 0x10FFFF) return 0;
    appendUtf8(codePoint.value, bytes);
    return 10;
  }
  const std::size_t prefix = kind == 'x' ? 2 : 1;
  const Number byte = kind == 'x' ? takeNumber(text.substr(2), 16, 2) : takeNumber(text.substr(1), 8, 3);
  if (byte.digits == 0) return 0;
  bytes += static_cast<char>(byte.value);
  return prefix + byte.digits;
}

}  // namespace orv::spelling
