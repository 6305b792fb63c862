// Reads the pieces of the binary format, strictly, from bytes that lie in one stretch of memory.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <span>

#include <orv/decode_error.hpp>
#include <orv/descriptor.hpp>

namespace orv::inline v0 {

namespace internal {

// How deep messages and groups may be nested.
inline constexpr int maximumNesting = 100;

}  // namespace internal

enum class WireType : std::uint8_t {
  varint = 0,
  fixed64 = 1,
  lengthDelimited = 2,
  startGroup = 3,
  endGroup = 4,
  fixed32 = 5,
};

// How a value travels.
constexpr WireType wireTypeOf(ValueType type) {
  switch (type) {
    case ValueType::boolean:
    case ValueType::uint32:
    case ValueType::enumeration: return WireType::varint;
    case ValueType::string:
    case ValueType::bytes:
    case ValueType::message: break;
  }
  return WireType::lengthDelimited;
}

// A field number, 1 to 2^29-1, and a wire type, which may be one of the reserved 6 and 7.
struct Tag {
  std::uint32_t value;

  constexpr std::uint32_t fieldNumber() const { return value >> 3; }
  constexpr WireType wireType() const { return static_cast<WireType>(value & 7); }
};

// What was wrong, and where: the pointer is into the reader's input.
struct WireFault {
  DecodeCause cause;
  const std::byte* at;
  std::uint32_t length = 0;  // for lengthOverrun: the length, and by how many bytes it overruns
  std::uint32_t detail = 0;
};

template <class T>
using WireResult = std::expected<T, WireFault>;

// A position in a stretch of bytes, which must outlive the reader. After a failed read the position is where
// the piece begins that could not be read; after a failed skip it may be anywhere behind.
class WireReader {
 public:
  WireReader() = default;
  explicit WireReader(std::span<const std::byte> bytes)
      : cursor_(bytes.data()), limit_(bytes.data() + bytes.size()) {}

  bool isAtEnd() const { return cursor_ == limit_; }
  const std::byte* position() const { return cursor_; }
  std::size_t remaining() const { return static_cast<std::size_t>(limit_ - cursor_); }

  // A tag of up to five bytes whose number is not 0.
  [[nodiscard]] WireResult<Tag> readTag() {
    if (cursor_ != limit_) {
      const auto first = std::to_integer<std::uint32_t>(*cursor_);
      if (first >= 8 && first < 0x80) [[likely]] {
        ++cursor_;
        return Tag{first};
      }
    }
    return readLongTag();
  }

  // A varint of up to ten bytes. Bits above 2^64 in the tenth are dropped.
  [[nodiscard]] WireResult<std::uint64_t> readVarint() {
    if (cursor_ != limit_ && *cursor_ < std::byte{0x80}) [[likely]]
      return std::to_integer<std::uint64_t>(*cursor_++);
    return readLongVarint();
  }

  // A length below 2^31 in up to five bytes, and as many bytes, all of them there.
  [[nodiscard]] WireResult<std::span<const std::byte>> readLengthDelimited();

  // A little-endian number.
  [[nodiscard]] WireResult<std::uint32_t> readFixed32();
  [[nodiscard]] WireResult<std::uint64_t> readFixed64();

  // Passes over the value behind the tag that was read at `tagStart`, a group with all that it holds
  // included. `nesting` is how many messages and groups the value is already in.
  [[nodiscard]] WireResult<void> skipValue(Tag tag, const std::byte* tagStart, int nesting);

  // What is next is a length-delimited value: counts the whole length-delimited records with this tag that
  // follow it, up to `most`, and up to the first other record or past all others. Consumes nothing.
  enum class Others : std::uint8_t { endTheCount, arePassedOver };
  std::size_t countFollowing(Tag tag, std::size_t most, Others others) const;

 private:
  WireResult<Tag> readLongTag();
  WireResult<std::uint64_t> readLongVarint();
  WireResult<void> skipBytes(std::size_t count);
  template <class Number>
  WireResult<Number> readFixed();
  WireResult<void> skipGroup(Tag start, const std::byte* tagStart, int nesting);

  const std::byte* cursor_ = nullptr;
  const std::byte* limit_ = nullptr;
};

}  // namespace orv
