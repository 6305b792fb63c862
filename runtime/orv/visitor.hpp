// What a message is walked by.
#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/internal/seam.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>

namespace orv::inline v0 {

// What every visit answers: nothing, or the visitor's own error, which ends the walk.
template <class V>
using VisitResult = internal::ResultOf<V>;

// The error of visitors that cannot fail: no value of it is ever made.
enum class NeverFails : std::uint8_t {};

// Takes the fields of a message from its traverse, in ascending order of their numbers, the unknown fields
// last. The binary encoder, the hashing and the rendering are visitors; anyone can write another, with an
// error type of its own, which reaches traverse's caller as it was made. A visitor has
//
//   using Error = …;
//   VisitResult visitSingularStringField(const Text&, std::uint32_t number)
//   VisitResult visitSingularBytesField(const ByteBuffer&, std::uint32_t number)
//   VisitResult visitSingularBoolField(bool, std::uint32_t number)
//   VisitResult visitSingularUInt32Field(std::uint32_t, std::uint32_t number)
//   VisitResult visitRepeatedStringField(const std::vector<Text>&, std::uint32_t number)
//   template <class E> VisitResult visitSingularEnumField(const E&, std::uint32_t number)
//   template <class M> VisitResult visitSingularMessageField(const M&, std::uint32_t number)
//   template <class M> VisitResult visitRepeatedMessageField(const std::vector<M>&, std::uint32_t number)
//   VisitResult visitUnknownFields(const UnknownStorage&)
//
// where VisitResult is std::expected<void, Error>. Only fields that are to be emitted are visited: a list is
// never empty, nor is the store of unknown fields. AnyValueVisitor is a base for visitors that treat many of
// these alike.
//
// A visitor may have one or both of these, which traverse calls first and last, for nested messages too.
// `fieldCount` is how many fields follow, a list counted as one, the unknown fields not counted.
//
//   template <class M> VisitResult beginMessage(const M&, std::size_t fieldCount)
//   template <class M> VisitResult endMessage(const M&)
template <class V>
concept Visitor = requires(V& visitor, const Text& text, const ByteBuffer& bytes,
                           const std::vector<Text>& texts, std::uint32_t number, bool flag,
                           const internal::SomeEnumeration& enumeration,
                           const UnknownStorage& unknownFields) {
  typename V::Error;
  { visitor.visitSingularStringField(text, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitSingularBytesField(bytes, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitSingularBoolField(flag, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitSingularUInt32Field(number, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitSingularEnumField(enumeration, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitRepeatedStringField(texts, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitUnknownFields(unknownFields) } -> std::same_as<VisitResult<V>>;
};

// A visitor whose operations for any message take M.
template <class V, class M>
concept VisitorOf = Visitor<V> &&
    requires(V& visitor, const M& message, const std::vector<M>& list, std::uint32_t number) {
  { visitor.visitSingularMessageField(message, number) } -> std::same_as<VisitResult<V>>;
  { visitor.visitRepeatedMessageField(list, number) } -> std::same_as<VisitResult<V>>;
};

}  // namespace orv
