#include <orv/utf8.hpp>

#include <algorithm>
#include <bit>
#include <cstring>

#include "byte_block.hpp"

namespace orv::inline v0::utf8 {

Step step(std::string_view text) noexcept {
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

namespace {

// The length of the code point at the start of these four bytes, the first in the lowest place: 2 to 4, or 0 if
// it is ASCII or ill-formed. Each length is a pattern of its lead and continuation bytes (table 3-6), and a few
// bits of lead and second byte that tell overlong forms, surrogates and what is above U+10FFFF (table 3-7).
std::size_t letterLength(std::uint32_t bytes) {
  if ((bytes & 0xC0F0) == 0x80E0 && (bytes & 0xC00000) == 0x800000) {
    const std::uint32_t deciding = bytes & 0x200F;
    return deciding != 0x0000 && deciding != 0x200D ? 3 : 0;
  }
  if ((bytes & 0xC0E0) == 0x80C0) return (bytes & 0x1E) != 0 ? 2 : 0;
  if ((bytes & 0xC0C0C0F8) == 0x808080F0) {
    const std::uint32_t deciding = bytes & 0x3007;
    const bool isAboveLowest = deciding != 0;
    const bool isBelowHighest = (bytes & 0x7) < 4 || deciding == 0x0004;
    return isAboveLowest && isBelowHighest ? 4 : 0;
  }
  return 0;
}

std::uint32_t fourBytesAt(const char* bytes) {
  std::uint32_t word;
  std::memcpy(&word, bytes, sizeof word);
  return std::endian::native == std::endian::little ? word : std::byteswap(word);
}

#ifdef ORV_HAS_BYTE_BLOCKS

using internal::ByteBlock;
using internal::eightAt;
using internal::sixteenAt;

// Whether the first `size` bytes, fewer than 64, are well-formed, by bits in parallel (R. D. Cameron, "A case study
// in SIMD text processing with parallel bit streams", PPoPP 2008): each lead byte says where continuation bytes
// have to be, and they have to be there and nowhere else (table 3-6). `continuations` are those that there are.
template <std::size_t parts>
bool isWellFormed(const ByteBlock<parts>& block, std::size_t size, std::uint64_t continuations) {
  const std::uint64_t nonAscii = block.below(0x00);
  const std::uint64_t belowLeads = block.below(0xC2);
  std::uint64_t expected = (nonAscii ^ belowLeads) << 1;
  std::uint64_t wrong = belowLeads ^ continuations;
  if (const std::uint64_t ofThreeOrMore = nonAscii ^ block.below(0xE0); ofThreeOrMore != 0) {
    const std::uint64_t ofFour = nonAscii ^ block.below(0xF0);
    expected |= ofThreeOrMore << 2 | ofFour << 3;
    // Some leads have a narrower range of the second byte (table 3-7).
    const std::uint64_t belowA0 = block.below(0xA0);
    wrong |= (block.equalTo(0xE0) << 1 & belowA0) | (block.equalTo(0xED) << 1 & ~belowA0);
    if (ofFour != 0) {
      const std::uint64_t below90 = block.below(0x90);
      wrong |= (block.equalTo(0xF0) << 1 & below90) | (block.equalTo(0xF4) << 1 & ~below90) |
               (nonAscii ^ block.below(0xF5));
    }
  }
  wrong |= expected ^ continuations;
  const std::uint64_t end = std::uint64_t{1} << size;
  return ((wrong & (end - 1)) | (expected & end)) == 0;
}

// How many bytes at the start are well-formed: all of them, or those in front of a block that is not.
std::size_t wellFormedBlocks(std::string_view text) {
  constexpr std::size_t blockSize = 64;
  std::size_t at = 0;
  while (text.size() - at >= blockSize) {
    const char* const bytes = text.data() + at;
    const ByteBlock<4> block{
        {sixteenAt(bytes), sixteenAt(bytes + 16), sixteenAt(bytes + 32), sixteenAt(bytes + 48)}};
    if (block.below(0x00) == 0) {
      at += blockSize;
      continue;
    }
    const std::uint64_t continuations = block.below(0xC0);
    // The letter that begins last may go on behind the block.
    const std::size_t size = blockSize - 1 - static_cast<std::size_t>(std::countl_zero(~continuations | 1));
    if (size == 0 || !isWellFormed(block, size, continuations)) break;
    at += size;
  }
  return at;
}

#endif

}  // namespace

bool isWellFormedWithin(const std::byte* bytes, std::size_t size) noexcept {
  const char* const characters = reinterpret_cast<const char*>(bytes);
#ifdef ORV_HAS_BYTE_BLOCKS
  const ByteBlock<3> block{{sixteenAt(characters), sixteenAt(characters + 16), eightAt(characters + 32)}};
  return isWellFormed(block, size, block.below(0xC0));
#else
  return isWellFormed({characters, size});
#endif
}

std::size_t wellFormedPrefix(std::string_view text) noexcept {
  if (isAscii(text)) [[likely]]
    return text.size();
  const char* const bytes = text.data();
  const std::size_t size = text.size();
#ifdef ORV_HAS_BYTE_BLOCKS
  std::size_t at = wellFormedBlocks(text);
#else
  std::size_t at = 0;
#endif
  while (at < size) {
    // ASCII is passed eight bytes at a time.
    while (size - at >= 8) {
      const std::uint64_t bits = internal::wordAt(bytes + at) & internal::highBits;
      const int ascii =
          std::endian::native == std::endian::little ? std::countr_zero(bits) : std::countl_zero(bits);
      at += static_cast<std::size_t>(ascii) / 8;
      if (bits != 0) break;
    }
    while (size - at >= 4) {
      const std::size_t length = letterLength(fourBytesAt(bytes + at));
      if (length == 0) break;
      at += length;
    }
    if (at == size) break;
    if (static_cast<unsigned char>(bytes[at]) < 0x80) {
      ++at;
      continue;
    }
    const Step next = step(text.substr(at));
    if (!next.isWellFormed) return at;
    at += next.length;
  }
  return at;
}

}  // namespace orv::utf8
