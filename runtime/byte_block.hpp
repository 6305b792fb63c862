// Asks a question of many bytes at once.
#pragma once

#if defined(__SSE2__)
#include <emmintrin.h>
#elif defined(__aarch64__) && defined(__ARM_NEON) && __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__
#include <arm_neon.h>
#endif

#include <array>
#include <cstddef>
#include <cstdint>
#include <utility>

namespace orv::inline v0::internal {

#if defined(__SSE2__)

#define ORV_HAS_BYTE_BLOCKS

using Sixteen = __m128i;

inline Sixteen sixteenAt(const char* bytes) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
}
// Eight bytes, and zeros.
inline Sixteen eightAt(const char* bytes) { return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(bytes)); }
inline Sixteen areBelow(Sixteen bytes, signed char limit) {
  return _mm_cmplt_epi8(bytes, _mm_set1_epi8(limit));
}
inline Sixteen areEqual(Sixteen bytes, signed char byte) {
  return _mm_cmpeq_epi8(bytes, _mm_set1_epi8(byte));
}
inline std::uint64_t gather(auto... answers) {
  std::uint64_t bits = 0;
  int shift = 0;
  ((bits |= static_cast<std::uint64_t>(static_cast<std::uint32_t>(_mm_movemask_epi8(answers))) << shift,
    shift += 16),
   ...);
  return bits;
}

#elif defined(__aarch64__) && defined(__ARM_NEON) && __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__

#define ORV_HAS_BYTE_BLOCKS

using Sixteen = int8x16_t;

inline Sixteen sixteenAt(const char* bytes) { return vld1q_s8(reinterpret_cast<const std::int8_t*>(bytes)); }
inline Sixteen eightAt(const char* bytes) {
  return vcombine_s8(vld1_s8(reinterpret_cast<const std::int8_t*>(bytes)), vdup_n_s8(0));
}
inline Sixteen areBelow(Sixteen bytes, signed char limit) {
  return vreinterpretq_s8_u8(vcltq_s8(bytes, vdupq_n_s8(limit)));
}
inline Sixteen areEqual(Sixteen bytes, signed char byte) {
  return vreinterpretq_s8_u8(vceqq_s8(bytes, vdupq_n_s8(byte)));
}
// Each byte's bit in its place of eight, then neighbours added until eight bits are one byte.
inline std::uint64_t gather(Sixteen first, Sixteen second, Sixteen third, Sixteen fourth = vdupq_n_s8(0)) {
  constexpr std::array<std::uint8_t, 16> places{1, 2, 4, 8, 16, 32, 64, 128, 1, 2, 4, 8, 16, 32, 64, 128};
  const uint8x16_t mask = vld1q_u8(places.data());
  const auto placed = [&](Sixteen answers) { return vandq_u8(vreinterpretq_u8_s8(answers), mask); };
  const uint8x16_t sums =
      vpaddq_u8(vpaddq_u8(placed(first), placed(second)), vpaddq_u8(placed(third), placed(fourth)));
  return vgetq_lane_u64(vreinterpretq_u64_u8(vpaddq_u8(sums, sums)), 0);
}

#endif

#ifdef ORV_HAS_BYTE_BLOCKS

// Up to 64 bytes. An answer has a bit for each, that of the first lowest.
template <std::size_t parts>
struct ByteBlock {
  // Bytes count as signed: from 0x80 upwards to 0xFF, then from 0 on.
  std::uint64_t below(unsigned char limit) const {
    return ask([&](Sixteen sixteen) { return areBelow(sixteen, static_cast<signed char>(limit)); });
  }
  std::uint64_t equalTo(unsigned char byte) const {
    return ask([&](Sixteen sixteen) { return areEqual(sixteen, static_cast<signed char>(byte)); });
  }
  std::uint64_t ask(auto question) const {
    return [&]<std::size_t... part>(std::index_sequence<part...>) { return gather(question(bytes[part])...); }
    (std::make_index_sequence<parts>());
  }

  Sixteen bytes[parts];
};

#endif

}  // namespace orv::inline v0::internal
