#include <orv/internal/inline_bytes.hpp>

#include <algorithm>
#include <array>
#include <cstdint>
#include <new>
#include <string>

#include <orv/utf8.hpp>

namespace orv::inline v0::internal {

namespace {

// Unlike memmove and memcpy, these take a null pointer where there is nothing to copy.
using std::char_traits;

// Copies bytes in three pieces of one size, which may overlap: the first, the last and, where these do not meet, the
// one in between. `mayTake` is given all of their bits before any is stored; what it answers is the answer.
template <class Word, std::size_t words>
[[gnu::always_inline]] inline bool copyPieces(char* target, const char* source, std::size_t size,
                                              auto mayTake) {
  using Piece = std::array<Word, words>;
  const std::array<std::size_t, 3> places{0, size > 2 * sizeof(Piece) ? sizeof(Piece) : 0,
                                          size - sizeof(Piece)};
  std::array<Piece, 3> pieces;
  Word bits = 0;
  for (std::size_t at = 0; at < places.size(); ++at) {
    std::memcpy(&pieces[at], source + places[at], sizeof(Piece));
    for (const Word word : pieces[at]) bits |= word;
  }
  if (!mayTake(bits)) return false;
  for (std::size_t at = 0; at < places.size(); ++at)
    std::memcpy(target + places[at], &pieces[at], sizeof(Piece));
  return true;
}

// Copies up to objectSize bytes, which may overlap, without a call.
[[gnu::always_inline]] inline bool copyShort(char* target, const char* source, std::size_t size,
                                             auto mayTake) {
  if (size >= 16) return copyPieces<std::uint64_t, 2>(target, source, size, mayTake);
  if (size >= 8) return copyPieces<std::uint64_t, 1>(target, source, size, mayTake);
  if (size >= 4) return copyPieces<std::uint32_t, 1>(target, source, size, mayTake);
  if (size >= 1) return copyPieces<std::uint8_t, 1>(target, source, size, mayTake);
  return true;
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
    copyShort(inlineData(), bytes.data(), bytes.size(), [](auto) { return true; });
    raw_[tagOffset] = static_cast<unsigned char>(bytes.size());
    return;
  }
  const Block block{allocate(bytes.size()), bytes.size(), bytes.size()};
  char_traits<char>::copy(block.data, bytes.data(), bytes.size());
  if (isOnHeap()) freeBlock();
  holdBlock(block);
}

bool InlineBytes::assignShortText(std::string_view text) {
  const bool isWellFormed =
      copyShort(isOnHeap() ? heapBlock().data : inlineData(), text.data(), text.size(), [&](auto bits) {
        return (bits & static_cast<decltype(bits)>(highBits)) == 0 || utf8::isWellFormed(text);
      });
  if (!isWellFormed) return false;
  if (isOnHeap()) {
    setBlockSize(text.size());
  } else {
    raw_[tagOffset] = static_cast<unsigned char>(text.size());
  }
  return true;
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
