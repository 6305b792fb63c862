// The storage that texts and byte buffers share.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <utility>

#include <orv/internal/words.hpp>

namespace orv::internal {

// Owned bytes. Up to 39 of them live inside the object, which covers a 36-character identifier, a 16-byte
// UUID and a typical handle without an allocation; longer contents live in one heap block of their own.
// docs/decisions/inline-bytes.md weighs the size.
class InlineBytes {
 public:
  static constexpr std::size_t inlineCapacity = 39;
  static constexpr std::size_t objectSize = 40;

  // All bytes are set, so that whole words may be read from then on.
  constexpr InlineBytes() noexcept : raw_{} {}
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
  std::string_view view() const {
    if (isOnHeap()) [[unlikely]] {
      const Block block = heapBlock();
      return {block.data, block.size};
    }
    return {reinterpret_cast<const char*>(raw_), raw_[tagOffset]};
  }
  std::size_t size() const { return isOnHeap() ? heapBlock().size : raw_[tagOffset]; }

  // Compares all words: what is behind the contents is masked away.
  friend bool operator==(const InlineBytes& left, const InlineBytes& right) {
    if (left.isOnHeap() || right.isOnHeap()) [[unlikely]]
      return left.view() == right.view();
    const std::size_t size = left.raw_[tagOffset];
    if (size != right.raw_[tagOffset]) return false;
    const char* const mask = contentMask(size);
    return anyWord([&](std::size_t at) {
             return (wordAt(left.raw_ + at) ^ wordAt(right.raw_ + at)) & wordAt(mask + at);
           }) == 0;
  }

  // Whether the first `size` bytes are ASCII, of objectSize that may be read; `size` is what fits inside.
  static bool isAsciiWithin(const std::byte* bytes, std::size_t size) {
    const char* const mask = contentMask(size);
    return (anyWord([&](std::size_t at) { return wordAt(bytes + at) & wordAt(mask + at); }) & highBits) == 0;
  }

  // All bits of what a function gives for the places of an object's words, without a loop.
  template <class WordOf>
  static std::uint64_t anyWord(WordOf wordOf) {
    return [&]<std::size_t... words>(std::index_sequence<words...>) {
      return (wordOf(words * sizeof(std::uint64_t)) | ...);
    }
    (std::make_index_sequence<objectSize / sizeof(std::uint64_t)>());
  }

  // objectSize bytes: `size` of them with all bits set, then zeros. With them, short contents are compared
  // and checked in words without a branch for their length.
  static const char* contentMask(std::size_t size) { return masks.data() + (objectSize - size); }

  // Whether the bytes live outside the object. If not, all objectSize bytes from view().data() on may be
  // read.
  constexpr bool isOnHeap() const { return raw_[tagOffset] == heapTag; }

  // The bytes may be part of this object's own contents.
  void assign(std::string_view bytes);
  void append(std::string_view bytes);

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

  static constexpr auto masks = [] {
    std::array<char, 2 * objectSize> bytes{};
    for (std::size_t at = 0; at < objectSize; ++at) bytes[at] = static_cast<char>(0xFF);
    return bytes;
  }();

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

}  // namespace orv::internal
