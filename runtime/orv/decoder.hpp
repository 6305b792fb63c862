// What a message is read from.
#pragma once

#include <concepts>
#include <cstdint>
#include <expected>
#include <optional>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>

namespace orv {

// What every read of a decoder answers: nothing, or the decoder's own error.
template <class D>
using DecodeResult = std::expected<void, typename D::Error>;

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
// wire type is left for the unknown fields.
template <class D>
concept Decoder = requires(D& decoder, Text& text, std::optional<Text>& optionalText,
                           std::vector<Text>& texts, ByteBuffer& bytes,
                           std::optional<ByteBuffer>& optionalBytes, bool& flag,
                           std::optional<bool>& optionalFlag, std::optional<std::uint32_t>& optionalNumber) {
  typename D::Error;
  { decoder.decodeSingularStringField(text) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularStringField(optionalText) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBytesField(bytes) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBytesField(optionalBytes) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBoolField(flag) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularBoolField(optionalFlag) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeSingularUInt32Field(optionalNumber) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeRepeatedStringField(texts) } -> std::same_as<DecodeResult<D>>;
  { decoder.handleConflictingOneOf() } -> std::same_as<DecodeResult<D>>;
};

// A decoder whose operations for any message take M.
template <class D, class M>
concept DecoderOf = Decoder<D> &&
    requires(D& decoder, M& message, std::optional<M>& slot, std::vector<M>& list) {
  {
    decoder.nextFieldNumber(message)
    } -> std::same_as<std::expected<std::optional<std::uint32_t>, typename D::Error>>;
  { decoder.decodeSingularMessageField(slot) } -> std::same_as<DecodeResult<D>>;
  { decoder.decodeRepeatedMessageField(list) } -> std::same_as<DecodeResult<D>>;
};

// A decoder that can look at its input twice. It says so with `static constexpr bool canReread = true`, and
// the rules then merge a repeated oneof member in place, where they copy the payload for other decoders: with
// many repeats that is the difference between linear and quadratic time. It has
//
//   // Whether the field whose number was given last can be read as a message at all.
//   bool isAtLengthDelimitedField() const;
//
//   // Reads the field into a default message. When it fails, part of it may be there: the caller drops it.
//   template <class M>
//   DecodeResult readNewMessage(M& message);
//
//   // Whether the field could be merged into this message, which is not touched. Takes nothing.
//   template <class M>
//   DecodeResult checkMessageField(const M& held);
//
//   // Merges a field that was checked, which cannot fail any more.
//   template <class M>
//   DecodeResult mergeMessageField(M& message);
template <class D>
concept RereadingDecoder = Decoder<D> && D::canReread;

}  // namespace orv
