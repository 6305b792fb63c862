// The rules of all messages: what every message type can do.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

#include <orv/binary_decoder.hpp>
#include <orv/binary_encoder.hpp>
#include <orv/decoder.hpp>
#include <orv/descriptor.hpp>
#include <orv/field.hpp>
#include <orv/hash_visitor.hpp>
#include <orv/hasher.hpp>
#include <orv/internal/storage.hpp>
#include <orv/name_map.hpp>
#include <orv/size_counter.hpp>
#include <orv/text_renderer.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv {

// The base of every message type M: a regular value that owns all that it holds. M adds its full name, its
// accessors, its storage and, in a private table `fields`, one row per field in ascending order of the
// numbers; everything here derives from that table. messages/core/rules.hpp holds the rules themselves. M's
// constructor is empty rather than defaulted: a defaulted one makes M() fill all of its memory with zeros
// first, which costs a fifth of the decoding of a list.
template <class M>
class Message {
 public:
  // The fields that were read but that M does not define, in the order of their arrival.
  const UnknownStorage& unknownFields() const { return unknownFields_; }
  UnknownStorage& mutableUnknownFields() { return unknownFields_; }
  void setUnknownFields(UnknownStorage value) { unknownFields_ = std::move(value); }

  // Field numbers and text names.
  static constexpr NameMap _protobuf_nameMap();

  // Full name and fields, with the types of nested messages.
  static constexpr const MessageDescriptor& descriptor();

  // No message has required fields.
  static constexpr bool isInitialized() { return true; }

  // Reads fields into this message until the decoder has no more: values are replaced, nested messages
  // merged, lists grown. The decoder's error is returned as it was made; what was read before it stays.
  template <DecoderOf<M> D>
  [[nodiscard]] DecodeResult<D> decodeMessage(D& decoder) {
    return decodeFields(decoder);
  }
  [[nodiscard]] std::expected<void, DecodeError> decodeMessage(BinaryDecoder& decoder);

  // Hands the fields that are to be emitted to the visitor, in ascending order, the unknown fields last. The
  // visitor's first error ends the walk and is returned as it was made.
  template <VisitorOf<M> V>
  [[nodiscard]] VisitResult<V> traverse(V& visitor) const {
    return visitFields(visitor);
  }
  [[nodiscard]] BinaryEncoder::Result traverse(BinaryEncoder& visitor) const;
  SizeCounter::Result traverse(SizeCounter& visitor) const;
  HashVisitor::Result traverse(HashVisitor& visitor) const;
  TextRenderer::Result traverse(TextRenderer& visitor) const;

  // Equal fields, in ascending order, and equal unknown fields.
  friend bool operator==(const M& left, const M& right) { return left.Message::hasEqualFields(right); }

  // As ==, for a message of any type: a message of another type is never equal.
  template <class Other>
  bool isEqualTo(const Other& other) const {
    if constexpr (std::is_same_v<M, Other>) return self() == other;
    return false;
  }

  // Equal messages hash alike.
  void hash(Hasher& into) const;
  std::uint64_t hashValue() const;

  // The message in the text format of Protocol Buffers, a field a line, unknown fields by number.
  std::string debugDescription() const;

  // Reads a message from its binary encoding, the whole of `bytes`.
  [[nodiscard]] static std::expected<M, DecodeError> parse(std::span<const std::byte> bytes);
  [[nodiscard]] static std::expected<M, DecodeError> parse(std::string_view bytes) {
    return parse(std::as_bytes(std::span(bytes)));
  }

  // As parse, into this message, whose memory is used again: whatever it held is gone. After an error it
  // holds what was read before. The bytes must not be this message's own.
  [[nodiscard]] std::expected<void, DecodeError> reparse(std::span<const std::byte> bytes);
  [[nodiscard]] std::expected<void, DecodeError> reparse(std::string_view bytes) {
    return reparse(std::as_bytes(std::span(bytes)));
  }

  // Reads fields into this message as decodeMessage does. After an error it holds what was read before. The
  // bytes must not be this message's own.
  [[nodiscard]] std::expected<void, DecodeError> merge(std::span<const std::byte> bytes);
  [[nodiscard]] std::expected<void, DecodeError> merge(std::string_view bytes) {
    return merge(std::as_bytes(std::span(bytes)));
  }

  // The binary encoding: fields in ascending order, unknown fields last. It fails only above 2^31-1 bytes.
  [[nodiscard]] std::expected<std::string, EncodeError> serialize() const;

  // As serialize, into the start of `buffer`; what is behind the encoding may be cleared. Answers how many
  // bytes it wrote; encodedSize() of them are enough.
  [[nodiscard]] std::expected<std::size_t, EncodeError> serializeInto(std::span<std::byte> buffer) const;

  // How many bytes serialize gives.
  std::size_t encodedSize() const;

 protected:
  Message() = default;
  Message(const Message&) = default;
  Message(Message&&) noexcept = default;
  Message& operator=(const Message&) = default;
  Message& operator=(Message&&) noexcept = default;
  ~Message() = default;

 private:
  friend BinaryDecoder;  // reads nested messages
  friend BinaryEncoder;  // guesses their sizes

  M& self() { return static_cast<M&>(*this); }
  const M& self() const { return static_cast<const M&>(*this); }

  // The rules, each written once for every decoder, every visitor and every row.
  template <class D>
  DecodeResult<D> decodeFields(D& decoder);
  template <std::size_t index, class D>
  DecodeResult<D> decodeRow(D& decoder, std::uint32_t number);
  template <class D, auto pointer, class Case>
  DecodeResult<D> decodeField(D& decoder, const Field<pointer, Case>& row);

  template <class D>
  DecodeResult<D> replaceFields(D& decoder);
  template <std::size_t index, class D>
  DecodeResult<D> replaceRow(D& decoder, std::uint32_t number, std::uint64_t& rowsRead);
  template <std::size_t index>
  void resetRow(std::uint64_t rowsRead);
  template <std::size_t index>
  static constexpr std::uint64_t rowBits();

  template <class V>
  VisitResult<V> visitFields(V& visitor) const;
  // Inlined by order: where g++ 12 calls it for some rows, a small message takes a tenth longer to encode.
  template <std::size_t index, class V>
  [[gnu::always_inline]] inline VisitResult<V> visitRowsFrom(V& visitor) const;
  template <class V, auto pointer, class Case>
  [[gnu::always_inline]] inline VisitResult<V> visitField(V& visitor, const Field<pointer, Case>& row) const;

  [[gnu::noinline]] std::expected<std::size_t, EncodeError> serializeCarefully(
      std::span<std::byte> buffer) const;

  // Tables made from M's; a template, because M is not complete where this class is.
  template <class Complete>
  struct Constants;

  // About how many bytes serialize gives: the elements of lists are judged by their size in memory, nested
  // messages hardly count. Takes no time to speak of, however long the lists.
  std::size_t likelyEncodedSize() const;

  bool hasEqualFields(const M& other) const;
  template <auto pointer, class Case>
  bool hasEqualField(const M& other, const Field<pointer, Case>& row) const;

  UnknownStorage unknownFields_;
};

}  // namespace orv

#include <orv/internal/rules.hpp>
