// The storage that texts and byte buffers share.
#pragma once

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <type_traits>
#include <utility>

#include <orv/internal/standard.hpp>

namespace orv::inline v0::internal {

// Eight bytes, which need not be aligned.
inline std::uint64_t wordAt(const void* bytes) {
  std::uint64_t word;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

// Set in each byte of a word that is not ASCII.
inline constexpr std::uint64_t highBits = 0x8080808080808080;

// Where sanitizers keep it from following what is moved, g++ believes that an empty std::optional's value is read.
#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"
#endif

// Owned bytes. Up to 39 of them live inside the object, which covers a 36-character identifier, a 16-byte
// UUID and a typical handle without an allocation; longer contents live in one heap block of their own.
// docs/decisions/inline-bytes.md weighs the size.
class InlineBytes {
 public:
  static constexpr std::size_t inlineCapacity = 39;
  static constexpr std::size_t objectSize = 40;

  // All bytes are set, so that whole words may be read from then on; at run time word by word, which the
  // compiler drops where others are written at once (docs/decisions/inline-bytes.md).
  constexpr InlineBytes() noexcept {
    if (std::is_constant_evaluated()) {
      for (unsigned char& byte : raw_) byte = 0;  // not covered: in constants
    } else {
      const std::uint64_t zero = 0;
      [&]<std::size_t... words>(std::index_sequence<words...>) {
        (std::memcpy(raw_ + words * sizeof zero, &zero, sizeof zero), ...);
      }
      (std::make_index_sequence<objectSize / sizeof(std::uint64_t)>());
    }
  }
  InlineBytes(const InlineBytes& other) {
    if (other.isOnHeap()) [[unlikely]]
      copyBlock(other.view());
    else
      std::memcpy(raw_, other.raw_, objectSize);
  }
  InlineBytes(InlineBytes&& other) noexcept {
    std::memcpy(raw_, other.raw_, objectSize);
    other.raw_[tagOffset] = 0;
  }
  InlineBytes& operator=(const InlineBytes& other) {
    if (isOnHeap() || other.isOnHeap()) {
      if (this != &other) assign(other.view());
    } else {
      std::memmove(raw_, other.raw_, objectSize);
    }
    return *this;
  }
  InlineBytes& operator=(InlineBytes&& other) noexcept {
    if (this != &other) {
      if (isOnHeap()) freeBlock();
      std::memcpy(raw_, other.raw_, objectSize);
      other.raw_[tagOffset] = 0;
    }
    return *this;
  }
  constexpr ~InlineBytes() {
    if (isOnHeap()) [[unlikely]]
      freeBlock();
  }

  // Valid until the object is changed or destroyed.
  std::string_view view() const ORV_BOUND {
    if (isOnHeap()) [[unlikely]] {
      const Block block = heapBlock();
      return {block.data, block.size};
    }
    return {reinterpret_cast<const char*>(raw_), raw_[tagOffset]};
  }
  std::size_t size() const { return isOnHeap() ? heapBlock().size : raw_[tagOffset]; }

  // Where all bytes of the objects are the same, as in a copy, so are their contents.
  friend bool operator==(const InlineBytes& left, const InlineBytes& right) {
    return (!left.isOnHeap() && areSame(left.raw_, right.raw_)) || haveEqualContents(left, right);
  }

  // Whether the first `size` bytes are ASCII, of objectSize that may be read; `size` is what fits inside.
  static bool isAsciiWithin(const std::byte* bytes, std::size_t size) {
#ifdef __SSE2__
    return (signs(part<0>(bytes), part<16>(bytes), lastPart(bytes)) & lowBits(size)) == 0;
#else
    const auto nonAscii = [&](std::size_t at) { return wordAt(bytes + at) & highBits; };
    return anyBit(nonAscii, size) == 0;
#endif
  }

  // Whether the bytes live outside the object. If not, all objectSize bytes from view().data() on may be
  // read.
  constexpr bool isOnHeap() const { return raw_[tagOffset] == heapTag; }

  // The bytes may be part of this object's own contents.
  void assign(std::string_view bytes);
  void append(std::string_view bytes);

  // Takes bytes that fit inside if they are well-formed UTF-8, and says whether they are.
  bool assignShortText(std::string_view text);

  // As assign, for bytes that are not this object's own: the old contents go first where the new ones need more
  // room, so that both are never held at once.
  void replace(std::string_view bytes);

  // Takes the first `size` bytes, which fit inside, of objectSize that may be read and are not this object's
  // own: one step of a fixed size, whatever their number.
  void assignWithin(const std::byte* bytes, std::size_t size) {
    if (isOnHeap()) [[unlikely]] {
      assign({reinterpret_cast<const char*>(bytes), size});
      return;
    }
    std::memcpy(raw_, bytes, objectSize);
    raw_[tagOffset] = static_cast<unsigned char>(size);
  }

 private:
  static constexpr std::size_t tagOffset = objectSize - 1;
  static constexpr unsigned char heapTag = 0xFF;

  static bool areSame(const unsigned char* left, const unsigned char* right) {
#ifdef __SSE2__
    const __m128i same = _mm_and_si128(_mm_and_si128(_mm_cmpeq_epi8(part<0>(left), part<0>(right)),
                                                     _mm_cmpeq_epi8(part<16>(left), part<16>(right))),
                                       _mm_cmpeq_epi8(lastPart(left), lastPart(right)));
    return _mm_movemask_epi8(same) == 0xFFFF;
#else
    std::uint64_t difference = 0;
    for (std::size_t at = 0; at < objectSize; at += sizeof difference)
      difference |= wordAt(left + at) ^ wordAt(right + at);
    return difference == 0;
#endif
  }
  static bool haveEqualContents(const InlineBytes& left, const InlineBytes& right);

#ifdef __SSE2__
  template <std::size_t at>
  static __m128i part(const void* bytes) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(static_cast<const char*>(bytes) + at));
  }
  // The last eight bytes.
  static __m128i lastPart(const void* bytes) {
    return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(static_cast<const char*>(bytes) + 32));
  }
  // The highest bit of each byte of an object, that of the first byte lowest.
  static std::uint64_t signs(__m128i first, __m128i second, __m128i last) {
    const auto gather = [](__m128i bytes) {
      return static_cast<std::uint64_t>(static_cast<std::uint32_t>(_mm_movemask_epi8(bytes)));
    };
    return gather(first) | gather(second) << 16 | gather(last) << 32;
  }
  static std::uint64_t lowBits(std::size_t count) { return (std::uint64_t{1} << count) - 1; }
#else
  // All bits of what a function gives for the words of an object, of its first `size` bytes, without a branch
  // for the size.
  template <class WordOf>
  static std::uint64_t anyBit(WordOf wordOf, std::size_t size) {
    const char* const mask = masks.data() + (objectSize - size);
    std::uint64_t bits = 0;
    for (std::size_t at = 0; at < objectSize; at += sizeof bits) bits |= wordOf(at) & wordAt(mask + at);
    return bits;
  }

  // From objectSize minus a size on: as many bytes with all bits set, then zeros.
  static constexpr auto masks = [] {
    std::array<char, 2 * objectSize> bytes{};
    for (std::size_t at = 0; at < objectSize; ++at) bytes[at] = static_cast<char>(0xFF);
    return bytes;
  }();
#endif

  struct Block {
    char* data;
    std::size_t size;
    std::size_t capacity;
  };

  char* inlineData() { return reinterpret_cast<char*>(raw_); }
  // Member by member, as below, and not as one piece: docs/decisions/inline-bytes.md.
  Block heapBlock() const {
    Block block;
    std::memcpy(&block.data, raw_ + offsetof(Block, data), sizeof block.data);
    std::memcpy(&block.size, raw_ + offsetof(Block, size), sizeof block.size);
    std::memcpy(&block.capacity, raw_ + offsetof(Block, capacity), sizeof block.capacity);
    return block;
  }
  void holdBlock(const Block& block) {
    std::memcpy(raw_ + offsetof(Block, data), &block.data, sizeof block.data);
    setBlockSize(block.size);
    std::memcpy(raw_ + offsetof(Block, capacity), &block.capacity, sizeof block.capacity);
    raw_[tagOffset] = heapTag;
  }
  void setBlockSize(std::size_t size) { std::memcpy(raw_ + offsetof(Block, size), &size, sizeof size); }
  void copyBlock(std::string_view bytes);
  void freeBlock() noexcept;

  // The bytes and, in the last place, their number; or a Block and, in the last place, heapTag.
  alignas(Block) unsigned char raw_[objectSize];
};

#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic pop
#endif

}  // namespace orv::internal
