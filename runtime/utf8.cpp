#include <orv/utf8.hpp>

#include <bit>

namespace orv::utf8 {

Step step(std::string_view text) {
  const auto byteAt = [&](std::size_t at) { return static_cast<unsigned char>(text[at]); };
  const unsigned char lead = byteAt(0);
  if (lead < 0x80) return {lead, 1, true};

  // Table 3-7: the lead byte gives the length, and for some leads a narrower range of the second byte, which
  // is what keeps out overlong forms, surrogates and code points above U+10FFFF.
  std::uint8_t length = 0;
  unsigned char lowest = 0x80;
  unsigned char highest = 0xBF;
  char32_t codePoint = 0;
  if (lead >= 0xC2 && lead <= 0xDF) {
    length = 2;
    codePoint = lead & 0x1F;
  } else if (lead >= 0xE0 && lead <= 0xEF) {
    length = 3;
    codePoint = lead & 0x0F;
    if (lead == 0xE0) lowest = 0xA0;
    if (lead == 0xED) highest = 0x9F;
  } else if (lead >= 0xF0 && lead <= 0xF4) {
    length = 4;
    codePoint = lead & 0x07;
    if (lead == 0xF0) lowest = 0x90;
    if (lead == 0xF4) highest = 0x8F;
  } else {
    return {0, 1, false};
  }
  for (std::uint8_t at = 1; at < length; ++at) {
    if (at == text.size() || byteAt(at) < lowest || byteAt(at) > highest) return {0, at, false};
    codePoint = (codePoint << 6) | (byteAt(at) & 0x3F);
    lowest = 0x80;
    highest = 0xBF;
  }
  return {codePoint, length, true};
}

std::size_t wellFormedPrefix(std::string_view text) {
  const char* const bytes = text.data();
  const std::size_t size = text.size();
  const auto byteAt = [&](std::size_t index) { return static_cast<unsigned char>(bytes[index]); };
  // A long ASCII text is checked fastest as such.
  constexpr std::size_t longText = 64;
  if (size >= longText && isAscii(text)) return size;
  std::size_t at = 0;
  while (at < size) {
    // ASCII is passed up to eight bytes at a time.
    if (size - at >= 8) {
      const std::uint64_t bits = wordAt(bytes + at) & highBits;
      const int ascii =
          std::endian::native == std::endian::little ? std::countr_zero(bits) : std::countl_zero(bits);
      at += static_cast<std::size_t>(ascii) / 8;
      if (bits == 0) continue;
    } else if (byteAt(at) < 0x80) {
      ++at;
      continue;
    }
    // The letters of most alphabets have two bytes; a call for each takes twice as long.
    if (byteAt(at) >= 0xC2 && byteAt(at) <= 0xDF && size - at >= 2 && (byteAt(at + 1) & 0xC0) == 0x80) {
      at += 2;
      continue;
    }
    const Step next = step(text.substr(at));
    if (!next.isWellFormed) return at;
    at += next.length;
  }
  return at;
}

}  // namespace orv::utf8
