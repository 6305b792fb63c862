// Writes messages in their binary encoding.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <expected>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/encode_error.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/size_counter.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>
#include <orv/wire_reader.hpp>

namespace orv {

// A visitor that writes what it is handed, in one pass:
//
//   std::string bytes;
//   BinaryEncoder encoder(bytes);
//   const auto result = message.traverse(encoder);
//   encoder.finish();
//
// (serialize and serializeInto are the same in one call.) A nested message is written behind as many length
// bytes as it will likely need, and moved in the rare case that it needs another number of them.
class BinaryEncoder {
 public:
  using Error = EncodeError;
  using Result = std::expected<void, EncodeError>;

  // Appends to `output`, which holds the bytes once finish() was called, and must outlive the encoder.
  explicit BinaryEncoder(std::string& output)
      : begin_(output.data() + output.size()), cursor_(begin_), limit_(begin_), growing_(&output) {}

  // Writes from the start of `buffer`, which stays the caller's. With careful guesses an encoding fits where
  // it fits exactly; with bold ones, which are right more often, it may need a few bytes more while it is
  // being written.
  enum class Guesses : std::uint8_t { bold, careful };
  explicit BinaryEncoder(std::span<std::byte> buffer, Guesses guesses = Guesses::careful)
      : begin_(reinterpret_cast<char*>(buffer.data())),
        cursor_(begin_),
        limit_(begin_ + std::min(buffer.size(), largestEncoding)),
        guesses_(guesses) {}

  BinaryEncoder(const BinaryEncoder&) = delete;
  BinaryEncoder& operator=(const BinaryEncoder&) = delete;

  // How many bytes were written. A string that is appended to gets its final size.
  std::size_t finish() {
    if (growing_ != nullptr) trimString();
    return written();
  }

  // Clears what fixed-size steps left behind the encoding in a caller's buffer: parts of other contents, it
  // may be.
  void wipeOverrun() {
    if (room() >= longestOverrun) {
      // At a fixed size it takes four stores, at another a loop as long as a small message's whole encoding.
      std::memset(cursor_, 0, longestOverrun);
    } else if (room() != 0) {
      std::memset(cursor_, 0, room());
    }
  }

  // The format's lengths, and those of the libraries that read it, are signed 32-bit numbers.
  static constexpr std::size_t largestEncoding = std::numeric_limits<std::int32_t>::max();

  // The operations that Visitor lists.

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    return writeBytes(value.bytes_, number);
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return writeBytes(value.bytes_, number);
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    return writeNumber(value ? 1 : 0, number);
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return writeNumber(value, number);
  }

  // The low 32 bits of the raw value travel, sign-extended to 64: ten bytes for a negative one.
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return writeNumber(travellingValue(value.rawValue()), number);
  }

  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    const std::size_t likelySize = message.likelyEncodedSize();
    std::size_t lengthBytes = likelySize < shortVarints ? 1 : varintSize(likelySize);
    return writeMessage(message, number, lengthBytes);
  }

  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) {
      if (auto written = writeBytes(text.bytes_, number); !written) return written;
    }
    return {};
  }

  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    // Each element is taken to need as many length bytes as the one before it.
    std::size_t lengthBytes = 1;
    for (const M& message : messages) {
      if (auto written = writeMessage(message, number, lengthBytes); !written) return written;
    }
    return {};
  }

  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  // What is left behind the encoding ends at most so far behind it.
  static constexpr std::size_t longestOverrun = InlineBytes::objectSize;
  // Tags of the field numbers 1 to 15 and varints below 128 take one byte.
  static constexpr std::uint32_t shortNumbers = 16;
  static constexpr std::uint64_t shortVarints = 0x80;
  // Varints below this take two.
  static constexpr std::uint64_t mediumVarints = 0x4000;

  std::size_t room() const { return static_cast<std::size_t>(limit_ - cursor_); }
  std::size_t written() const { return static_cast<std::size_t>(cursor_ - begin_); }
  static char shortTag(std::uint32_t number, WireType type) {
    return static_cast<char>(number << 3 | static_cast<std::uint32_t>(type));
  }

  // Where there is room enough, short contents are written in one fixed-size step; what is behind them is
  // overwritten.
  Result writeBytes(const InlineBytes& bytes, std::uint32_t number) {
    const std::string_view contents = bytes.view();
    if (number < shortNumbers) [[likely]] {
      // A copy of the cursor, because what is written through it might, for all the compiler knows, be the
      // cursor.
      char* target = cursor_;
      if (!bytes.isOnHeap() && room() >= 2 + InlineBytes::objectSize) [[likely]] {
        target[0] = shortTag(number, WireType::lengthDelimited);
        target[1] = static_cast<char>(contents.size());
        std::memcpy(target + 2, contents.data(), InlineBytes::objectSize);
        cursor_ = target + 2 + contents.size();
        return {};
      }
      if (contents.size() < mediumVarints && room() >= 3 + contents.size()) [[likely]] {
        *target++ = shortTag(number, WireType::lengthDelimited);
        if (contents.size() >= shortVarints) *target++ = static_cast<char>((contents.size() & 0x7F) | 0x80);
        *target++ =
            static_cast<char>(contents.size() >= shortVarints ? contents.size() >> 7 : contents.size());
        cursor_ = target + contents.size();
        std::memcpy(target, contents.data(), contents.size());
        return {};
      }
    }
    return writeLongBytes(contents, number);
  }

  Result writeNumber(std::uint64_t value, std::uint32_t number) {
    if (number < shortNumbers && value < shortVarints && room() >= 2) [[likely]] {
      char* const target = cursor_;
      target[0] = shortTag(number, WireType::varint);
      target[1] = static_cast<char>(value);
      cursor_ = target + 2;
      return {};
    }
    return writeLongNumber(value, number);
  }

  // Writes a nested message behind the given number of length bytes, and sets it to the number that it took.
  template <class M>
  Result writeMessage(const M& message, std::uint32_t number, std::size_t& lengthBytes) {
    if (guesses_ == Guesses::careful) lengthBytes = 1;
    if (auto begun = beginNested(number, lengthBytes); !begun) return begun;
    const std::size_t start = written();
    if (auto walked = message.traverse(*this); !walked) return walked;
    return endNested(start, lengthBytes);
  }

  Result beginNested(std::uint32_t number, std::size_t lengthBytes) {
    if (number < shortNumbers && room() >= 1 + lengthBytes) [[likely]] {
      char* const target = cursor_;
      *target = shortTag(number, WireType::lengthDelimited);
      cursor_ = target + 1 + lengthBytes;
      return {};
    }
    return beginLongNested(number, lengthBytes);
  }

  Result endNested(std::size_t start, std::size_t& lengthBytes) {
    const std::size_t length = written() - start;
    char* const body = begin_ + start;
    if (lengthBytes == 1 && length < shortVarints) [[likely]] {
      body[-1] = static_cast<char>(length);
      return {};
    }
    if (lengthBytes == 2 && length >= shortVarints && length < mediumVarints) {
      body[-2] = static_cast<char>((length & 0x7F) | 0x80);
      body[-1] = static_cast<char>(length >> 7);
      return {};
    }
    return endLongNested(start, lengthBytes);
  }

  Result writeLongBytes(std::string_view bytes, std::uint32_t number);
  Result writeLongNumber(std::uint64_t value, std::uint32_t number);
  Result beginLongNested(std::uint32_t number, std::size_t lengthBytes);
  Result endLongNested(std::size_t start, std::size_t& lengthBytes);
  Result makeRoom(std::size_t size) {
    if (room() >= size) [[likely]]
      return {};
    return grow(size);
  }
  Result grow(std::size_t size);
  void trimString();

  char* begin_;  // of the encoding: a string may hold something before it
  char* cursor_;
  char* limit_;
  Guesses guesses_ = Guesses::bold;
  std::string* growing_ = nullptr;  // none: a caller's buffer
};

}  // namespace orv
