#include <orv/internal/inline_bytes.hpp>

#include <algorithm>
#include <array>
#include <cstdint>
#include <new>
#include <string>

namespace orv::inline v0::internal {

namespace {

// Unlike memmove and memcpy, these take a null pointer where there is nothing to copy.
using std::char_traits;

// Copies up to objectSize bytes, which may overlap, without a call: in two pieces of a fixed size, or three.
void copyShort(char* target, const char* source, std::size_t size) {
  const auto copyEnds = [&]<class Piece>(Piece) {
    Piece first;
    Piece last;
    std::memcpy(&first, source, sizeof first);
    std::memcpy(&last, source + size - sizeof last, sizeof last);
    std::memcpy(target, &first, sizeof first);
    std::memcpy(target + size - sizeof last, &last, sizeof last);
  };
  using Sixteen = std::array<std::uint64_t, 2>;
  if (size > 32) {
    Sixteen middle;
    std::memcpy(&middle, source + sizeof middle, sizeof middle);
    copyEnds(Sixteen());
    std::memcpy(target + sizeof middle, &middle, sizeof middle);
  } else if (size >= 16) {
    copyEnds(Sixteen());
  } else if (size >= 8) {
    copyEnds(std::uint64_t());
  } else if (size >= 4) {
    copyEnds(std::uint32_t());
  } else {
    char_traits<char>::move(target, source, size);
  }
}

char* allocate(std::size_t size) { return static_cast<char*>(::operator new(size)); }

}  // namespace

void InlineBytes::assign(std::string_view bytes) {
  if (isOnHeap()) {
    const Block block = heapBlock();
    if (bytes.size() <= block.capacity) {
      char_traits<char>::move(block.data, bytes.data(), bytes.size());
      setBlockSize(bytes.size());
      return;
    }
  } else if (bytes.size() <= inlineCapacity) {
    copyShort(inlineData(), bytes.data(), bytes.size());
    raw_[tagOffset] = static_cast<unsigned char>(bytes.size());
    return;
  }
  const Block block{allocate(bytes.size()), bytes.size(), bytes.size()};
  char_traits<char>::copy(block.data, bytes.data(), bytes.size());
  if (isOnHeap()) freeBlock();
  holdBlock(block);
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
