// Writes messages in their binary encoding.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <expected>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "runtime/byte_buffer.hpp"
#include "runtime/encode_error.hpp"
#include "runtime/encoded_size.hpp"
#include "runtime/inline_bytes.hpp"
#include "runtime/text.hpp"
#include "runtime/unknown_storage.hpp"
#include "runtime/visitor.hpp"
#include "runtime/wire_reader.hpp"

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
  explicit BinaryEncoder(std::string& output);
  // Writes from the start of `buffer`, which stays the caller's. An encoding fits where it fits exactly;
  // while it is written, a wrong guess of a nested length may need up to four bytes more.
  explicit BinaryEncoder(std::span<std::byte> buffer);

  BinaryEncoder(const BinaryEncoder&) = delete;
  BinaryEncoder& operator=(const BinaryEncoder&) = delete;

  // How many bytes were written. A string that is appended to gets its final size.
  std::size_t finish();

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
    const auto travelling = static_cast<std::int32_t>(value.rawValue());
    return writeNumber(static_cast<std::uint64_t>(std::int64_t{travelling}), number);
  }

  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    const std::size_t lengthBytes = 1;
    if (auto begun = beginNested(number, lengthBytes); !begun) return begun;
    const auto start = written();
    if (auto walked = message.traverse(*this); !walked) return walked;
    return endNested(start, lengthBytes);
  }

  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) {
      if (auto written = writeBytes(text.bytes_, number); !written) return written;
    }
    return {};
  }

  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (const M& message : messages) {
      if (auto written = visitSingularMessageField(message, number); !written) return written;
    }
    return {};
  }

  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  // Tags of the field numbers 1 to 15 and varints below 128 take one byte.
  static constexpr std::uint32_t shortNumbers = 16;
  static constexpr std::uint64_t shortVarints = 0x80;

  std::size_t room() const { return static_cast<std::size_t>(limit_ - cursor_); }
  std::size_t written() const { return static_cast<std::size_t>(cursor_ - begin_); }
  void putShort(std::uint64_t value) { *cursor_++ = static_cast<char>(value); }
  void putShortTag(std::uint32_t number, WireType type) {
    putShort(number << 3 | static_cast<std::uint32_t>(type));
  }

  // Where there is room enough, short contents are written in one fixed-size step; what is behind them is
  // overwritten.
  Result writeBytes(const InlineBytes& bytes, std::uint32_t number) {
    if (number < shortNumbers && !bytes.isOnHeap() && room() >= 2 + InlineBytes::objectSize) [[likely]] {
      const std::string_view contents = bytes.view();
      putShortTag(number, WireType::lengthDelimited);
      putShort(contents.size());
      std::memcpy(cursor_, contents.data(), InlineBytes::objectSize);
      cursor_ += contents.size();
      return {};
    }
    return writeLongBytes(bytes.view(), number);
  }

  Result writeNumber(std::uint64_t value, std::uint32_t number) {
    if (number < shortNumbers && value < shortVarints && room() >= 2) [[likely]] {
      putShortTag(number, WireType::varint);
      putShort(value);
      return {};
    }
    return writeLongNumber(value, number);
  }

  Result beginNested(std::uint32_t number, std::size_t lengthBytes) {
    if (number < shortNumbers && room() >= 1 + lengthBytes) [[likely]] {
      putShortTag(number, WireType::lengthDelimited);
      cursor_ += lengthBytes;
      return {};
    }
    return beginLongNested(number, lengthBytes);
  }

  Result endNested(std::size_t start, std::size_t lengthBytes) {
    const std::size_t length = written() - start;
    if (lengthBytes == 1 && length < shortVarints) [[likely]] {
      begin_[start - 1] = static_cast<char>(length);
      return {};
    }
    return endLongNested(start, lengthBytes);
  }

  Result writeLongBytes(std::string_view bytes, std::uint32_t number);
  Result writeLongNumber(std::uint64_t value, std::uint32_t number);
  Result beginLongNested(std::uint32_t number, std::size_t lengthBytes);
  Result endLongNested(std::size_t start, std::size_t lengthBytes);
  Result makeRoom(std::size_t size);

  char* begin_;
  char* cursor_;
  char* limit_;
  std::string* growing_ = nullptr;  // none: a caller's buffer
  std::size_t oldSize_ = 0;         // what the string held before
};

}  // namespace orv
