// Reads messages from their binary encoding.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <span>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "runtime/byte_buffer.hpp"
#include "runtime/decode_error.hpp"
#include "runtime/decoder.hpp"
#include "runtime/name_map.hpp"
#include "runtime/text.hpp"
#include "runtime/unknown_storage.hpp"
#include "runtime/utf8.hpp"
#include "runtime/wire_reader.hpp"

namespace orv {

// What a BinaryDecoder asks when a oneof member arrives while its group already holds a case. It refers to a
// callable that returns std::expected<void, DecodeError> and must outlive it. An error refuses the member and
// ends the decoding; it reaches the caller as it was made.
class ConflictHook {
 public:
  // Accepts: the member read last wins.
  constexpr ConflictHook() = default;

  template <class Callable>
  requires std::is_invocable_r_v<std::expected<void, DecodeError>, Callable&> ConflictHook(
      Callable& callable)  // NOLINT(google-explicit-constructor): a callable is a hook
      : callable_(&callable), call_([](void* target) -> std::expected<void, DecodeError> {
          return (*static_cast<Callable*>(target))();
        }) {}

  std::expected<void, DecodeError> operator()() const {
    if (call_ == nullptr) return {};
    return call_(callable_);
  }

 private:
  void* callable_ = nullptr;
  std::expected<void, DecodeError> (*call_)(void*) = nullptr;
};

// Reads one message from bytes that lie in one stretch of memory and outlive the decoder:
//
//   BinaryDecoder decoder(bytes);
//   const auto result = message.decodeMessage(decoder);
//
// (parse and merge are the same in one call.) Decoding n bytes takes time and memory in proportion to n,
// whatever they are. An error says what is wrong, at which byte, in which field.
class BinaryDecoder {
 public:
  using Error = DecodeError;
  using Result = std::expected<void, DecodeError>;

  explicit BinaryDecoder(std::span<const std::byte> bytes, ConflictHook hook = {})
      : reader_(bytes), input_{bytes.data(), bytes.data() + bytes.size(), hook} {}

  // The operations that Decoder lists.

  template <class M>
  std::expected<std::optional<std::uint32_t>, DecodeError> nextFieldNumber(M& message) {
    if (reader_.position() == valueStart_) [[unlikely]] {
      if (auto kept = keepUnknown(message.mutableUnknownFields()); !kept)
        return std::unexpected(kept.error());
    }
    if (message_ == nullptr) message_ = &factsOf<M>;
    if (reader_.isAtEnd()) {
      valueStart_ = nullptr;
      return std::nullopt;
    }
    recordStart_ = reader_.position();
    const auto tag = reader_.readTag();
    if (!tag) [[unlikely]] {
      tag_ = Tag{0};
      return fail(tag.error());
    }
    tag_ = *tag;
    valueStart_ = reader_.position();
    return tag->fieldNumber();
  }

  Result decodeSingularStringField(Text& value) { return readText(value); }
  Result decodeSingularStringField(std::optional<Text>& value) { return readText(value); }
  Result decodeSingularBytesField(ByteBuffer& value) { return readBytes(value); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>& value) { return readBytes(value); }
  Result decodeSingularBoolField(bool& value) { return readBool(value); }
  Result decodeSingularBoolField(std::optional<bool>& value) { return readBool(value); }

  // The low 32 bits of the varint.
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>& value) {
    return readVarint([&](std::uint64_t varint) { value = static_cast<std::uint32_t>(varint); });
  }

  // The low 32 bits of the varint as a signed number.
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>& value) {
    return readVarint([&](std::uint64_t varint) { value = Enumeration(static_cast<std::int32_t>(varint)); });
  }

  // A failed read leaves the slot as it was: absent, or holding what it held.
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    if (!isAtMessageField()) return {};
    if (slot.has_value()) {
      if (auto checked = checkMessageField<M>(); !checked) return checked;
      return readMessageField(*slot);
    }
    auto result = readMessageField(slot.emplace());
    if (!result) [[unlikely]]
      slot.reset();
    return result;
  }

  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    if (tag_.wireType() != WireType::lengthDelimited) return {};
    const auto bytes = readWellFormed();
    if (!bytes) [[unlikely]]
      return std::unexpected(bytes.error());
    makeRoom(texts);
    texts.emplace_back().bytes_.assignReadable(*bytes, readableFrom(*bytes));
    return {};
  }

  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    if (!isAtMessageField()) return {};
    const auto body = reader_.readLengthDelimited();
    if (!body) [[unlikely]]
      return fail(body.error());
    makeRoom(messages);
    auto result = readNested(messages.emplace_back(), *body, mode_);
    if (!result) [[unlikely]]
      messages.pop_back();
    return result;
  }

  Result handleConflictingOneOf() {
    if (mode_ == Mode::confirmed) return {};
    return input_.hook();
  }

  // The operations that RereadingDecoder lists.

  static constexpr bool canReread = true;

  bool isAtMessageField() const { return tag_.wireType() == WireType::lengthDelimited; }

  // Decodes a copy of nothing: the field is read into a message that is then dropped.
  template <class M>
  Result checkMessageField() const {
    if (mode_ != Mode::careful || !isAtMessageField()) return {};
    WireReader reader = reader_;
    const auto body = reader.readLengthDelimited();
    if (!body) return fail(body.error());
    M scratch;
    auto result = readNested(scratch, *body, Mode::checking);
    return result;
  }

  // Call it after checkMessageField if the message held anything before.
  template <class M>
  Result readMessageField(M& message) {
    if (!isAtMessageField()) return {};
    const auto body = reader_.readLengthDelimited();
    if (!body) [[unlikely]]
      return fail(body.error());
    return readNested(message, *body, mode_);
  }

 private:
  // What became of the message that is being read, should it fail.
  enum class Mode : std::uint8_t {
    careful,    // it keeps what was read: a present nested message must be checked before it is merged into
    checking,   // it is dropped
    confirmed,  // it cannot fail: it was read once before, and the hook was asked then
  };

  struct Input {
    const std::byte* begin;
    const std::byte* end;
    ConflictHook hook;
  };

  BinaryDecoder(const BinaryDecoder& outer, std::span<const std::byte> body, const MessageFacts& message,
                Mode mode)
      : reader_(body),
        message_(&message),
        outer_(&outer),
        nesting_(outer.nesting_ + 1),
        mode_(mode),
        input_(outer.input_) {}

  template <class M>
  Result readNested(M& message, std::span<const std::byte> body, Mode mode) const {
    BinaryDecoder nested(*this, body, factsOf<M>, mode);
    if (nested.nesting_ > maximumNesting) [[unlikely]]
      return failTooDeep();
    return message.decodeMessage(nested);
  }

  template <class Slot>
  Result readText(Slot& slot) {
    if (tag_.wireType() != WireType::lengthDelimited) return {};
    const auto bytes = readWellFormed();
    if (!bytes) [[unlikely]]
      return std::unexpected(bytes.error());
    presentValue(slot).bytes_.assignReadable(*bytes, readableFrom(*bytes));
    return {};
  }

  template <class Slot>
  Result readBytes(Slot& slot) {
    if (tag_.wireType() != WireType::lengthDelimited) return {};
    const auto body = reader_.readLengthDelimited();
    if (!body) [[unlikely]]
      return fail(body.error());
    const std::string_view bytes(reinterpret_cast<const char*>(body->data()), body->size());
    presentValue(slot).bytes_.assignReadable(bytes, readableFrom(bytes));
    return {};
  }

  // Any number but 0 is true.
  template <class Slot>
  Result readBool(Slot& slot) {
    return readVarint([&](std::uint64_t varint) { slot = varint != 0; });
  }

  template <class Store>
  Result readVarint(Store store) {
    if (tag_.wireType() != WireType::varint) return {};
    const auto varint = reader_.readVarint();
    if (!varint) [[unlikely]]
      return fail(varint.error());
    store(*varint);
    return {};
  }

  std::expected<std::string_view, DecodeError> readWellFormed() {
    const auto body = reader_.readLengthDelimited();
    if (!body) [[unlikely]]
      return fail(body.error());
    const std::string_view bytes(reinterpret_cast<const char*>(body->data()), body->size());
    if (!utf8::isWellFormed(bytes)) [[unlikely]]
      return failIllFormed(bytes);
    return bytes;
  }

  template <class T>
  static T& presentValue(T& value) {
    return value;
  }
  template <class T>
  static T& presentValue(std::optional<T>& value) {
    return value.has_value() ? *value : value.emplace();
  }

  std::size_t readableFrom(std::string_view bytes) const {
    return static_cast<std::size_t>(input_.end - reinterpret_cast<const std::byte*>(bytes.data()));
  }

  // Before an element is added to a full list: room for it and for the records of the same field that follow
  // it directly, so that a list that arrives in one run is allocated once.
  template <class T>
  void makeRoom(std::vector<T>& list) const {
    if (list.size() < list.capacity()) [[likely]]
      return;
    const std::size_t run = 1 + reader_.countRecords(tag_);
    list.reserve(list.size() + (run > list.size() ? run : list.size()));
  }

  Result keepUnknown(UnknownStorage& unknownFields);

  std::unexpected<DecodeError> fail(const WireFault& fault) const;
  std::unexpected<DecodeError> failIllFormed(std::string_view text) const;
  std::unexpected<DecodeError> failTooDeep() const;

  WireReader reader_;
  const std::byte* recordStart_ = nullptr;
  const std::byte* valueStart_ = nullptr;  // where the value of the field begins that nobody took yet
  const MessageFacts* message_ = nullptr;  // the type of the message that is being read, once that is known
  const BinaryDecoder* outer_ = nullptr;   // who reads the enclosing message
  Tag tag_{0};
  std::uint8_t nesting_ = 0;
  Mode mode_ = Mode::careful;
  Input input_;
};

}  // namespace orv
