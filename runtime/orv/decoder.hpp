// What a message is read from.
#pragma once

#include <concepts>
#include <cstdint>
#include <expected>
#include <optional>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/internal/seam.hpp>
#include <orv/text.hpp>

namespace orv::inline v0 {

// What every read of a decoder answers: nothing, or the decoder's own error.
template <class D>
using DecodeResult = internal::ResultOf<D>;

// A source of fields, for a message's decodeMessage. BinaryDecoder is one; anyone can write another, with an
// error type of its own, which reaches decodeMessage's caller as it was made. A decoder has
//
//   using Error = …;
//
//   // The number of the next field of `message`, or none at the end. A field that nobody took since the last
//   // call is the decoder's to keep, in message.mutableUnknownFields().
//   template <class M>
//   std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M& message);
//
//   // Each reads the field whose number was given last. The plain form writes the value, the other makes the
//   // field present with it; a list grows. A failed read leaves the old value.
//   DecodeResult decodeSingularStringField(Text&);
//   DecodeResult decodeSingularStringField(std::optional<Text>&);
//   DecodeResult decodeSingularBytesField(ByteBuffer&);
//   DecodeResult decodeSingularBytesField(std::optional<ByteBuffer>&);
//   DecodeResult decodeSingularBoolField(bool&);
//   DecodeResult decodeSingularBoolField(std::optional<bool>&);
//   DecodeResult decodeSingularUInt32Field(std::optional<std::uint32_t>&);
//   DecodeResult decodeRepeatedStringField(std::vector<Text>&);
//   template <class E>
//   DecodeResult decodeSingularEnumField(std::optional<E>&);
//
//   // Into a new default message when absent, merging into the one held when present.
//   template <class M>
//   DecodeResult decodeSingularMessageField(std::optional<M>&);
//   template <class M>
//   DecodeResult decodeRepeatedMessageField(std::vector<M>&);
//
//   // Asked when a oneof member was read while the group already holds a case; an error refuses it.
//   DecodeResult handleConflictingOneOf();
//
// where DecodeResult is std::expected<void, Error>. What reads a field need not take it: a field of the wrong
// wire type is left for the unknown fields. AnyValueDecoder is a base for decoders that treat many of these
// alike.
//
// A decoder may read a oneof member itself, where it can do better than to copy the payload that is held,
// merge into the copy, ask handleConflictingOneOf and store it. The outcome is to be the same.
//
//   template <class Case, class... Cases>
//   DecodeResult decodeCase(std::optional<std::variant<Cases...>>& group);
template <class D>
concept Decoder = requires(D& decoder, Text& text, std::optional<Text>& optionalText,
                           std::vector<Text>& texts, ByteBuffer& bytes,
                           std::optional<ByteBuffer>& optionalBytes, bool& flag,
                           std::optional<bool>& optionalFlag, std::optional<std::uint32_t>& optionalNumber,
                           std::optional<internal::SomeEnumeration>& optionalCase) {
  typename D::Error;
  { decoder.decodeSingularStringField(text) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularStringField(optionalText) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBytesField(bytes) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBytesField(optionalBytes) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBoolField(flag) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBoolField(optionalFlag) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularUInt32Field(optionalNumber) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularEnumField(optionalCase) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeRepeatedStringField(texts) } -> std::same_as<DecodeResult<D>>;
  { decoder.handleConflictingOneOf() } -> std::same_as<DecodeResult<D>>;
};

// A decoder whose operations for any message take M.
template <class D, class M>
concept DecoderOf = Decoder<D> &&
    requires(D& decoder, M& message, std::optional<M>& slot, std::vector<M>& list) {
  { decoder.nextFieldNumber(message) } -> std::same_as<internal::NextNumberOf<D>>;
  { decoder.decodeSingularMessageField(slot) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeRepeatedMessageField(list) } -> std::same_as<DecodeResult<D>>;
};

}  // namespace orv
