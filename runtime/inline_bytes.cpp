#include <orv/internal/inline_bytes.hpp>

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <new>
#include <string>
#include <type_traits>

#include <orv/utf8.hpp>

namespace orv::inline v0::internal {

namespace {

// Unlike memmove and memcpy, these take a null pointer where there is nothing to copy.
using std::char_traits;

// Up to 39 bytes as an object holds them: zeros behind them, and their number in the last place. They are gathered in
// registers and stored in the widths that a copy loads, since a load waits for narrower stores
// (docs/decisions/inline-bytes.md).
class Inside {
 public:
  // The bytes of all sizes with so many whole words.
  template <std::size_t wholeWords>
  [[gnu::always_inline]] Inside(const char* bytes, std::size_t size,
                                std::integral_constant<std::size_t, wholeWords>) {
    for (std::size_t at = 0; at < wholeWords; ++at) words_[at] = little(wordAt(bytes + sizeof(Word) * at));
    if constexpr (wholeWords == 0) {
      words_[0] =
          size < 4 ? upToThree(bytes, size) : fourAt(bytes) | fourAt(bytes + size - 4) << (8 * (size - 4));
    } else {
      // What is behind the whole words is the end of the last eight bytes.
      words_[wholeWords] =
          little(wordAt(bytes + size - sizeof(Word))) >> 8 >> (56 - 8 * (size % sizeof(Word)));
    }
    words_.back() |= Word{size} << 56;
  }

  [[gnu::always_inline]] bool isAscii() const {
    Word bits = 0;
    for (const Word word : words_) bits |= word;
    return (bits & highBits) == 0;
  }
  [[gnu::always_inline]] void store(void* target) const {
    auto* const bytes = static_cast<char*>(target);
#ifdef __SSE2__
    const auto two = [&](std::size_t at) {
      return _mm_set_epi64x(static_cast<std::int64_t>(words_[at + 1]), static_cast<std::int64_t>(words_[at]));
    };
    _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes), two(0));
    _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes + 16), two(2));
    std::memcpy(bytes + 32, &words_[4], sizeof(Word));
#else
    std::array<Word, 5> words = words_;
    for (Word& word : words) word = little(word);
    std::memcpy(bytes, words.data(), sizeof words);
#endif
  }

 private:
  using Word = std::uint64_t;

  // To and from a value whose lowest place is the first byte in memory.
  template <class Unsigned>
  static Unsigned little(Unsigned word) {
    return std::endian::native == std::endian::little ? word : std::byteswap(word);
  }
  static Word fourAt(const char* bytes) {
    std::uint32_t word;
    std::memcpy(&word, bytes, sizeof word);
    return little(word);
  }
  static Word upToThree(const char* bytes, std::size_t size) {
    if (size == 0) return 0;
    const auto placed = [&](std::size_t at) {
      return Word{static_cast<unsigned char>(bytes[at])} << (8 * at);
    };
    return placed(0) | placed(size / 2) | placed(size - 1);
  }

  std::array<Word, 5> words_{};
};

// What `use` answers for up to 39 bytes as an object holds them. It is compiled for each number of whole words, which
// keeps them in registers.
[[gnu::always_inline]] inline bool asInside(std::string_view bytes, auto use) {
  const auto with = [&]<std::size_t wholeWords>(std::integral_constant<std::size_t, wholeWords> whole) {
    return use(Inside(bytes.data(), bytes.size(), whole));
  };
  if (bytes.size() >= 32) return with(std::integral_constant<std::size_t, 4>());
  if (bytes.size() >= 24) return with(std::integral_constant<std::size_t, 3>());
  if (bytes.size() >= 16) return with(std::integral_constant<std::size_t, 2>());
  if (bytes.size() >= 8) return with(std::integral_constant<std::size_t, 1>());
  return with(std::integral_constant<std::size_t, 0>());
}

char* allocate(std::size_t size) { return static_cast<char*>(::operator new(size)); }

}  // namespace

bool InlineBytes::haveEqualContents(const InlineBytes& left, const InlineBytes& right) {
  return left.view() == right.view();
}

void InlineBytes::assign(std::string_view bytes) {
  if (isOnHeap()) {
    const Block block = heapBlock();
    if (bytes.size() <= block.capacity) {
      char_traits<char>::move(block.data, bytes.data(), bytes.size());
      setBlockSize(bytes.size());
      return;
    }
  } else if (bytes.size() <= inlineCapacity) {
    asInside(bytes, [&](const Inside& inside) {
      inside.store(raw_);
      return true;
    });
    return;
  }
  const Block block{allocate(bytes.size()), bytes.size(), bytes.size()};
  char_traits<char>::copy(block.data, bytes.data(), bytes.size());
  if (isOnHeap()) freeBlock();
  holdBlock(block);
}

bool InlineBytes::assignShortText(std::string_view text) {
  return asInside(text, [&](const Inside& inside) {
    if (!inside.isAscii()) {
      std::array<std::byte, objectSize> bytes;
      inside.store(bytes.data());
      if (!utf8::isWellFormedWithin(bytes.data(), text.size())) return false;
    }
    if (isOnHeap()) [[unlikely]] {
      // A block is larger than an object.
      const Block block = heapBlock();
      inside.store(block.data);
      setBlockSize(text.size());
    } else {
      inside.store(raw_);
    }
    return true;
  });
}

void InlineBytes::replace(std::string_view bytes) {
  if (isOnHeap() && heapBlock().capacity < bytes.size()) {
    freeBlock();
    raw_[tagOffset] = 0;
  }
  assign(bytes);
}

void InlineBytes::append(std::string_view bytes) {
  const std::string_view old = view();
  const std::size_t size = old.size() + bytes.size();
  if (!isOnHeap() && size <= inlineCapacity) {
    char_traits<char>::move(inlineData() + old.size(), bytes.data(), bytes.size());
    raw_[tagOffset] = static_cast<unsigned char>(size);
    return;
  }
  if (isOnHeap() && size <= heapBlock().capacity) {
    char_traits<char>::move(heapBlock().data + old.size(), bytes.data(), bytes.size());
    setBlockSize(size);
    return;
  }
  const std::size_t capacity = std::max(size, 2 * old.size());
  const Block block{allocate(capacity), size, capacity};
  std::memcpy(block.data, old.data(), old.size());
  char_traits<char>::copy(block.data + old.size(), bytes.data(), bytes.size());
  if (isOnHeap()) freeBlock();
  holdBlock(block);
}

void InlineBytes::copyBlock(std::string_view bytes) {
  if (bytes.size() <= inlineCapacity) {
    std::memcpy(raw_, bytes.data(), bytes.size());
    raw_[tagOffset] = static_cast<unsigned char>(bytes.size());
    return;
  }
  const Block block{allocate(bytes.size()), bytes.size(), bytes.size()};
  std::memcpy(block.data, bytes.data(), bytes.size());
  holdBlock(block);
}

void InlineBytes::freeBlock() noexcept { ::operator delete(heapBlock().data); }

}  // namespace orv::internal
