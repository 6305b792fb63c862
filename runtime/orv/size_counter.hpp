// Counts the bytes of a message's binary encoding without writing it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/internal/varint.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

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
    return add(number, internal::varintSize(value));
  }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return add(number, internal::varintSize(internal::travellingValue(value.rawValue())));
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
    size_ += internal::varintSize(std::uint64_t{number} << 3) + size;
    return {};
  }
  Result addLengthDelimited(std::uint32_t number, std::uint64_t length) {
    return add(number, internal::varintSize(length) + length);
  }

  std::uint64_t size_ = 0;
};

}  // namespace orv
