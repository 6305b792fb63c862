// Counts the bytes of a message's binary encoding without writing it.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv {

// How many bytes a varint takes: one for each seven bits up to the highest that is set. 9/64 is a seventh
// rounded up, and exact for up to 64 bits.
constexpr std::size_t varintSize(std::uint64_t value) {
  return (9 * static_cast<std::size_t>(std::bit_width(value | 1)) + 64) / 64;
}

// The varint of an enumeration's raw value: its low 32 bits, sign-extended.
constexpr std::uint64_t travellingValue(std::int64_t rawValue) {
  return static_cast<std::uint64_t>(std::int64_t{static_cast<std::int32_t>(rawValue)});
}

// A visitor that adds up what BinaryEncoder would write.
class SizeCounter {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  std::uint64_t size() const { return size_; }

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    return addLengthDelimited(number, value.sizeInBytes());
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return addLengthDelimited(number, value.size());
  }
  Result visitSingularBoolField(bool, std::uint32_t number) { return add(number, 1); }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return add(number, varintSize(value));
  }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return add(number, varintSize(travellingValue(value.rawValue())));
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    SizeCounter nested;
    (void)message.traverse(nested);
    return addLengthDelimited(number, nested.size());
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) (void)addLengthDelimited(number, text.sizeInBytes());
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (const M& message : messages) (void)visitSingularMessageField(message, number);
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields) {
    size_ += unknownFields.records().size();
    return {};
  }

 private:
  Result add(std::uint32_t number, std::uint64_t size) {
    size_ += varintSize(std::uint64_t{number} << 3) + size;
    return {};
  }
  Result addLengthDelimited(std::uint32_t number, std::uint64_t length) {
    return add(number, varintSize(length) + length);
  }

  std::uint64_t size_ = 0;
};

}  // namespace orv
