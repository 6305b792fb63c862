// The rules of all messages: what every message type can do.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <functional>
#include <iosfwd>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>

#include <orv/byte_buffer.hpp>
#include <orv/decode_error.hpp>
#include <orv/decoder.hpp>
#include <orv/encode_error.hpp>
#include <orv/field.hpp>
#include <orv/hasher.hpp>
#include <orv/internal/presence.hpp>
#include <orv/internal/rules.hpp>
#include <orv/internal/table.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

class BinaryDecoder;
class BinaryEncoder;
struct DecodeLimits;
class SizeCounter;
class HashVisitor;
class TextRenderer;

namespace internal {
class Step;
struct OutermostFrame;
}

// How many bytes of a message stand on one line, for a log, unless told otherwise.
inline constexpr std::size_t longestLine = std::size_t{64} << 10;

// The base of every message type M: a regular value that owns all that it holds. M adds its full name, its
// accessors, its storage and, in a private table `fields`, one row per field in ascending order of the
// numbers; everything here derives from that table. M's constructor is best written empty, `M() noexcept {}`:
// a defaulted one takes longer (docs/decisions/inline-bytes.md). Its assignments are best those of assign, since
// defaulted ones leave M half changed where memory runs out. In M's default every byte that has a meaning is 0:
// it holds nothing but its fields.
//
// A getter changes nothing: what is absent reads as its default. `mutable…` is for changing a field in place, and
// makes it present by being called, even if nothing is changed. A reference that either gives is valid until the
// message is assigned to or destroyed, or the field that it refers to is set or cleared: not beyond the full
// expression in `M::parse(bytes)->field()`, whose message is a temporary.
//
// What is only declared here is compiled once for each type, by the line `template class orv::Message<M>;` in
// a source that includes <orv/instantiate.hpp>.
template <class M>
class Message {
 public:
  // The fields that were read but that M does not define, in the order of their arrival.
  const UnknownStorage& unknownFields() const ORV_BOUND { return unknownFields_; }
  UnknownStorage& mutableUnknownFields() { return unknownFields_; }
  void setUnknownFields(UnknownStorage value) { unknownFields_ = std::move(value); }

  // Field numbers and text names.
  static constexpr NameMap _protobuf_nameMap() { return Table<M>::nameMap(); }

  // Full name and fields, with the types of nested messages.
  static constexpr const MessageDescriptor& descriptor() { return Table<M>::descriptor; }

  // No message has required fields.
  static constexpr bool isInitialized() { return true; }

  // Reads fields into this message until the decoder has no more: values are replaced, nested messages
  // merged, lists grown. The decoder's error is returned as it was made; what was read before it stays.
  template <DecoderOf<M> D>
  [[nodiscard, gnu::always_inline]] DecodeResult<D> decodeMessage(D& decoder) {
    return internal::readFields<Table<M>>(
        self(), decoder, [&]<std::size_t index>(D & at) __attribute__((always_inline)) {
          return internal::decodeRow<Table<M>, index>(self(), at);
        });
  }
  [[nodiscard]] std::expected<void, DecodeError> decodeMessage(BinaryDecoder& decoder);

  // Hands the fields that are to be emitted to the visitor, in ascending order, the unknown fields last. The
  // visitor's first error ends the walk and is returned as it was made.
  template <VisitorOf<M> V>
  [[nodiscard, gnu::always_inline]] VisitResult<V> traverse(V& visitor) const {
    return internal::visitFields<Table<M>>(self(), visitor);
  }
  [[nodiscard]] std::expected<void, EncodeError> traverse(BinaryEncoder& visitor) const;
  std::expected<void, NeverFails> traverse(SizeCounter& visitor) const;
  std::expected<void, NeverFails> traverse(HashVisitor& visitor) const;
  std::expected<void, NeverFails> traverse(TextRenderer& visitor) const;

  // Equal fields, in ascending order, and equal unknown fields.
  friend bool operator==(const M& left, const M& right) { return left.Message::isEqual(right); }

  // As ==, for a message of any type: a message of another type is never equal.
  template <class Other>
  bool isEqualTo(const Other& other) const {
    if constexpr (std::is_same_v<M, Other>)
      return self() == other;
    else
      return false;
  }

  // An order for sets and maps, which agrees with ==: field by field as they are compared there, what is
  // absent first, and the unknown fields as bytes. It says nothing about the messages' meaning.
  friend std::weak_ordering operator<=>(const M& left, const M& right) { return left.Message::order(right); }

  // Equal messages hash alike.
  void hash(Hasher& into) const;
  std::uint64_t hashValue() const;

  // The message in the text format of Protocol Buffers, a field a line, unknown fields by number.
  std::string debugDescription() const;

  // The same on one line behind the full name: `orv.Member { handle: "anna@tablet" tokenID: "t1" }`. More than
  // longestLine bytes of fields are cut there, and end in "…".
  friend std::ostream& operator<<(std::ostream& out, const M& message) {
    message.Message::print(out);
    return out;
  }

  // For logs: on one line as well, with `<redacted>` for the values of the fields that are secret by M's table,
  // and of the unknown ones, of which nobody knows. Cut as well.
  std::string redactedDescription(std::size_t maximumSizeInBytes = longestLine) const;

  // Reads a message from its binary encoding, the whole of `bytes`.
  [[nodiscard]] static std::expected<M, DecodeError> parse(ByteView bytes);

  // As parse, into this message, whose memory is used again: whatever it held is gone. After an error it
  // holds what was read before. The bytes must not be this message's own.
  [[nodiscard]] std::expected<void, DecodeError> reparse(ByteView bytes);

  // Reads fields into this message as decodeMessage does. After an error it holds what was read before. The
  // bytes must not be this message's own.
  [[nodiscard]] std::expected<void, DecodeError> merge(ByteView bytes);

  // The same with limits to what they cost (<orv/decode_limits.hpp>); without, the format's own alone hold.
  [[nodiscard]] static std::expected<M, DecodeError> parse(ByteView bytes, const DecodeLimits& limits);
  [[nodiscard]] std::expected<void, DecodeError> reparse(ByteView bytes, const DecodeLimits& limits);
  [[nodiscard]] std::expected<void, DecodeError> merge(ByteView bytes, const DecodeLimits& limits);

  // The binary encoding: fields in ascending order, unknown fields last. It fails only above 2^31-1 bytes.
  [[nodiscard]] std::expected<std::string, EncodeError> serialize() const;

  // As serialize, into the start of `buffer`; what is behind the encoding may be cleared. Answers how many
  // bytes it wrote; encodedSize() of them are enough.
  [[nodiscard]] std::expected<std::size_t, EncodeError> serializeInto(std::span<std::byte> buffer) const;
  template <internal::ByteRoom Buffer>
  [[nodiscard]] std::expected<std::size_t, EncodeError> serializeInto(Buffer&& buffer) const {
    const std::span<std::byte> room = std::as_writable_bytes(std::span(buffer));
    return serializeInto(room);
  }

  // How many bytes serialize gives.
  std::size_t encodedSize() const;

  // About how many bytes serialize gives, in constant time: lists are judged by their lengths, nested
  // messages hardly count. Encoders guess by it how many bytes a message's length will take.
  std::size_t likelyEncodedSize() const {
    std::size_t size = 0;
    Table<M>::forEachIndex([&]<std::size_t index>() {
      if constexpr (Table<M>::template isFirstRow<index>)
        size += internal::likelySize(Table<M>::template storage<index>(self()));
    });
    return size;
  }

  // As decodeMessage, into a message whose old contents go and whose memory is used again: what reparse does,
  // for the messages nested in one.
  template <class Reader>
  static internal::Step replaceMessage(M& message, Reader& reader);

 protected:
  Message() = default;
  Message(const Message&) = default;
  Message(Message&&) noexcept = default;
  Message& operator=(const Message&) = default;
  Message& operator=(Message&&) noexcept = default;
  ~Message() = default;

  // What M's assignments do. A copy is made whole before anything changes, so that M is left as it was where
  // memory runs out; a message that is assigned to itself keeps its value.
  M& assign(const M& other);
  M& assign(M&& other) noexcept {
    static_assert(std::is_nothrow_move_constructible_v<M>);
    if (this != &other) {
      std::destroy_at(&self());
      std::construct_at(&self(), std::move(other));
    }
    return self();
  }

 private:
  static std::expected<M, DecodeError> parseIn(std::span<const std::byte> bytes,
                                               internal::OutermostFrame&& frame);

  M& self() { return static_cast<M&>(*this); }
  const M& self() const { return static_cast<const M&>(*this); }

  // M's table; a template, because M is not complete where this class is.
  struct Rows {
    template <class Complete>
    static consteval const auto& of() {
      return Complete::fields;
    }
  };
  template <class Complete>
  using Table = internal::Table<Complete, Rows>;

  bool isEqual(const M& other) const {
    return internal::haveEqualFields<Table<M>>(self(), other) && unknownFields_ == other.unknownFields_;
  }

  std::weak_ordering order(const M& other) const;
  void print(std::ostream& out) const;

  UnknownStorage unknownFields_;
};

// The payload if a oneof holds this case, none otherwise. It lives as long as the oneof is unchanged.
//
//   if (const auto* added = orv::held<Group::MemberAdded>(group.event())) …
template <class Case, class... Cases>
const Case* held(const std::optional<std::variant<Cases...>>& oneof ORV_BOUND) {
  return oneof.has_value() ? std::get_if<Case>(&*oneof) : nullptr;
}

}  // namespace orv

template <orv::internal::IsMessage M>
struct std::hash<M> : orv::internal::StandardHash<M> {};
