// Hashes messages.
#pragma once

#include <cstdint>
#include <expected>
#include <string_view>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/hasher.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

// A visitor that feeds each field's number and value, and the unknown fields, into a hasher.
class HashVisitor {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  explicit HashVisitor(Hasher& hasher) : hasher_(hasher) {}

  Result visitSingularStringField(const Text& value, std::uint32_t number) { return feed(value, number); }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return feed(value, number);
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    return feedNumbers(number, value ? 1 : 0);
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return feedNumbers(number, value);
  }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return feed(value, number);
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    hasher_.combine(std::uint64_t{number});
    (void)message.traverse(*this);
    // Number 0 ends a nested message: no field has it.
    hasher_.combine(std::uint64_t{0});
    return {};
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    (void)feedNumbers(number, texts.size());
    for (const Text& text : texts) text.hash(hasher_);
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (const M& message : messages) (void)visitSingularMessageField(message, number);
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields) {
    const auto records = unknownFields.records();
    hasher_.combine(std::string_view(reinterpret_cast<const char*>(records.data()), records.size()));
    return {};
  }

 private:
  template <class Value>
  Result feed(const Value& value, std::uint32_t number) {
    hasher_.combine(std::uint64_t{number});
    value.hash(hasher_);
    return {};
  }
  Result feedNumbers(std::uint64_t first, std::uint64_t second) {
    hasher_.combine(first);
    hasher_.combine(second);
    return {};
  }

  Hasher& hasher_;
};

}  // namespace orv
