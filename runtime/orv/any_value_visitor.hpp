// A base for visitors that treat many kinds of fields alike.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <string>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/descriptor.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

// Hands each value that is no message to Derived, the elements of a list one by one:
//
//   Result visitAnyValue(const T& value, std::uint32_t number)
//
// where T is Text, ByteBuffer, bool, std::uint32_t or an enumeration. Nested messages are walked, unknown
// fields passed over. Derived declares those operations of its own for which it has something better to do;
// what it does with a nested message, it does around walkNested.
template <class Derived, class E = NeverFails>
class AnyValueVisitor {
 public:
  using Error = E;
  using Result = std::expected<void, E>;

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    return self().visitAnyValue(value, number);
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return self().visitAnyValue(value, number);
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    return self().visitAnyValue(value, number);
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return self().visitAnyValue(value, number);
  }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return self().visitAnyValue(value, number);
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t) {
    return walkNested(message);
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) {
      if (auto visited = self().visitSingularStringField(text, number); !visited) return visited;
    }
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (const M& message : messages) {
      if (auto visited = self().visitSingularMessageField(message, number); !visited) return visited;
    }
    return {};
  }
  Result visitUnknownFields(const UnknownStorage&) { return {}; }

  template <class M>
  Result beginMessage(const M&, std::size_t) {
    message_ = &M::descriptor();
    return {};
  }

 protected:
  // Walks a message inside the one that is being walked, which fields belong to again afterwards.
  template <class M>
  Result walkNested(const M& message) {
    const MessageDescriptor* const outer = message_;
    auto walked = message.traverse(self());
    message_ = outer;
    return walked;
  }

  // A field of the message that is being walked; none for a number that the message does not define.
  const FieldDescriptor* field(std::uint32_t number) const {
    return message_ != nullptr ? message_->field(number) : nullptr;
  }
  // The field's name, or its number where it has none.
  std::string fieldName(std::uint32_t number) const {
    const FieldDescriptor* const named = field(number);
    return named != nullptr ? std::string(named->name) : std::to_string(number);
  }

 private:
  Derived& self() { return static_cast<Derived&>(*this); }

  const MessageDescriptor* message_ = nullptr;  // that is being walked
};

}  // namespace orv
