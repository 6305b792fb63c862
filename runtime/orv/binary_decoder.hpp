// Reads messages from their binary encoding.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <limits>
#include <optional>
#include <span>
#include <string_view>
#include <utility>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/conflict_hook.hpp>
#include <orv/decode_error.hpp>
#include <orv/decoder.hpp>
#include <orv/descriptor.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/internal/presence.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/utf8.hpp>
#include <orv/wire_reader.hpp>

namespace orv {

// Reads one message from bytes that lie in one stretch of memory and outlive the decoder:
//
//   BinaryDecoder decoder(bytes);
//   const auto result = message.decodeMessage(decoder);
//
// (parse and merge are the same in one call.) Decoding n bytes takes time and memory in proportion to n,
// whatever they are. A decodeMessage that is given a BinaryDecoder fails with a DecodeError: what is wrong,
// at which byte, in which field.
//
// Each nested message is read by a decoder of its own, which knows the one that reads the enclosing message.
class BinaryDecoder {
 public:
  // What the single operations fail with: an empty sign. A DecodeError passed up through every level of
  // nesting made all decoding a tenth slower; failure() puts it together. The sign is copied by hand because
  // g++ 12 packs small results that copy trivially into registers by way of memory, in pieces that the
  // processor cannot forward: with that, decoding takes twice as long.
  struct Failure {
    Failure() = default;
    Failure(const Failure&) noexcept {}
    Failure& operator=(const Failure&) noexcept { return *this; }
  };
  using Error = Failure;
  using Result = std::expected<void, Failure>;
  using NextFieldNumber = std::expected<std::optional<std::uint32_t>, Failure>;

  explicit BinaryDecoder(std::span<const std::byte> bytes, ConflictHook hook = {})
      : reader_(bytes), readableEnd_(bytes.data() + bytes.size()), begin_(bytes.data()), hook_(hook) {}
  BinaryDecoder(const BinaryDecoder&) = delete;
  BinaryDecoder& operator=(const BinaryDecoder&) = delete;

  // What was wrong, as decodeMessage answers it. Only for a decoder one of whose operations failed.
  std::expected<void, DecodeError> failure();

  // The operations that Decoder lists.

  template <class M>
  NextFieldNumber nextFieldNumber(M& message) {
    if (reader_.position() == valueStart_) [[unlikely]] {
      if (auto kept = keepUnknown(message.mutableUnknownFields()); !kept)
        return std::unexpected(kept.error());
    }
    message_ = &M::descriptor();
    if (reader_.isAtEnd()) {
      valueStart_ = nothing;
      return {};
    }
    recordStart_ = reader_.position();
    tag_ = reader_.readShortTag();
    if (tag_.value == 0) [[unlikely]] {
      if (auto read = readLongTag(); !read) return std::unexpected(read.error());
    }
    valueStart_ = reader_.position();
    return NextFieldNumber(std::in_place, std::in_place, tag_.fieldNumber());
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
    if (!isAtLengthDelimitedField()) return {};
    if (slot.has_value()) {
      if (auto checked = checkMessageField(*slot); !checked) return checked;
      return mergeMessageField(*slot);
    }
    auto read = readNewMessage(slot.emplace());
    if (!read) slot.reset();
    return read;
  }

  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    if (!isLengthDelimited()) return {};
    makeRoom(texts);
    auto read = readText(texts.emplace_back());
    if (!read) texts.pop_back();
    return read;
  }

  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    if (!isLengthDelimited()) return {};
    makeRoom(messages);
    // The place of an element that comes later is fetched meanwhile: in a list too long for the caches a
    // sixth of all decoding.
    constexpr std::size_t ahead = 16;
    __builtin_prefetch(messages.data() + std::min(messages.size() + ahead, messages.capacity()), 1);
    auto read = readNewMessage(messages.emplace_back());
    if (!read) messages.pop_back();
    return read;
  }

  Result handleConflictingOneOf();

  // The operations that RereadingDecoder lists.

  static constexpr bool canReread = true;

  bool isAtLengthDelimitedField() const { return isLengthDelimited(); }

  template <class M>
  Result readNewMessage(M& message) {
    return readMessage(message, mode_);
  }

  // Reads the field into a message that is then dropped: a copy of the one that is there if a oneof in it
  // decides whether a hook is asked.
  template <class M>
  Result checkMessageField(const M& held) {
    if (!isChecking() || !isAtLengthDelimitedField()) return {};
    const WireReader here = reader_;
    M scratch;
    if constexpr (M::descriptor().holdsOneof()) {
      if (outermost().hook_.isSet()) scratch = held;
    }
    auto read = readMessage(scratch, Mode::checking);
    reader_ = here;
    return read;
  }

  template <class M>
  Result mergeMessageField(M& message) {
    return readMessage(message, isChecking() ? Mode::confirmed : mode_);
  }

  // For the replacing of a message, which takes its first occurrence of each field as if there had been none.

  // Whether the field whose number was given last was taken.
  bool hasTakenField() const { return reader_.position() != valueStart_; }

  // Reads the field in the memory of a message that is to be replaced by it.
  template <class M>
  Result replaceMessageField(M& message) {
    return readMessage(message, mode_,
                       [](M& nested, BinaryDecoder& decoder) { return nested.replaceFields(decoder); });
  }

 private:
  // What becomes of a message whose reading fails.
  enum class Mode : std::uint8_t {
    careful,    // it keeps what was read, so a nested message is checked before it is merged into one there
    checking,   // it is dropped, so nothing need be checked
    confirmed,  // it cannot fail: all of it was read once before, and the hook was asked then
  };

  static constexpr const std::byte* nothing = nullptr;

  BinaryDecoder(BinaryDecoder& outer, std::span<const std::byte> body, Mode mode)
      : reader_(body),
        readableEnd_(outer.readableEnd_),
        outer_(&outer),
        nesting_(static_cast<std::uint8_t>(outer.nesting_ + 1)),
        mode_(mode) {}

  // Whether a message is checked before it is merged. Inside one that is dropped there is no need, but for a
  // hook, which is asked about what can be read alone.
  bool isChecking() {
    return mode_ == Mode::careful || (mode_ == Mode::checking && outermost().hook_.isSet());
  }

  bool isLengthDelimited() const { return tag_.wireType() == WireType::lengthDelimited; }

  // What follows is inlined by order: g++ 12 calls most of it otherwise, at the price of a fifth of all
  // decoding.

  // Whether the length-delimited field could be read.
  [[gnu::always_inline]] bool readBody(std::span<const std::byte>& body) {
    if (reader_.readShortLengthDelimited(body)) [[likely]]
      return true;
    const auto longer = reader_.readLengthDelimited();
    if (longer) {
      body = *longer;
    } else {
      (void)fail(longer.error());
    }
    return longer.has_value();
  }

  template <class M>
  Result readMessage(M& message, Mode mode) {
    return readMessage(message, mode,
                       [](M& nested, BinaryDecoder& decoder) { return nested.decodeFields(decoder); });
  }

  template <class M, class Read>
  [[gnu::always_inline]] Result readMessage(M& message, Mode mode, Read read) {
    if (!isLengthDelimited()) return {};
    std::span<const std::byte> body;
    if (!readBody(body)) [[unlikely]]
      return failed();
    BinaryDecoder nested(*this, body, mode);
    if (nested.nesting_ > maximumNesting) [[unlikely]]
      return failTooDeep();
    return read(message, nested);
  }

  template <class Slot>
  [[gnu::always_inline]] Result readText(Slot& slot) {
    if (!isLengthDelimited()) return {};
    std::span<const std::byte> body;
    if (!readBody(body)) [[unlikely]]
      return failed();
    const std::string_view bytes = characters(body);
    const std::size_t readable = readableFrom(body);
    if (!InlineBytes::isShortAscii(bytes, readable)) {
      const std::size_t wellFormed = utf8::wellFormedPrefix(bytes);
      if (wellFormed != bytes.size()) [[unlikely]]
        return failIllFormed(bytes, wellFormed);
    }
    presentValue(slot).bytes_.assignReadable(bytes, readable);
    return {};
  }

  template <class Slot>
  [[gnu::always_inline]] Result readBytes(Slot& slot) {
    if (!isLengthDelimited()) return {};
    std::span<const std::byte> body;
    if (!readBody(body)) [[unlikely]]
      return failed();
    presentValue(slot).bytes_.assignReadable(characters(body), readableFrom(body));
    return {};
  }

  // Any number but 0 is true.
  template <class Slot>
  Result readBool(Slot& slot) {
    return readVarint([&](std::uint64_t varint) { slot = varint != 0; });
  }

  template <class Store>
  [[gnu::always_inline]] Result readVarint(Store store) {
    if (tag_.wireType() != WireType::varint) return {};
    const auto varint = reader_.readVarint();
    if (!varint) [[unlikely]]
      return fail(varint.error());
    store(*varint);
    return {};
  }

  static std::string_view characters(std::span<const std::byte> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
  }

  std::size_t readableFrom(std::span<const std::byte> bytes) const {
    return static_cast<std::size_t>(readableEnd_ - bytes.data());
  }

  // Before an element is added to a full list: room for it and for the records of the same field that follow
  // its own directly. A list that arrives in one run is thus allocated twice at most: for its first few
  // elements, so that an error among them is found before the whole run was counted, and then for all.
  template <class T>
  void makeRoom(std::vector<T>& list) const {
    if (list.size() < list.capacity()) [[likely]]
      return;
    constexpr std::size_t firstFew = 8;
    const std::size_t most = list.empty() ? firstFew - 1 : std::numeric_limits<std::size_t>::max();
    const std::size_t run = 1 + reader_.countFollowing(tag_, most);
    list.reserve(list.size() + std::max(run, list.size()));
  }

  static std::unexpected<Failure> failed() { return std::unexpected(Failure()); }
  std::unexpected<Failure> fail(const WireFault& fault) {
    return fail(fault.cause, fault.at, fault.length, fault.detail);
  }
  std::unexpected<Failure> fail(DecodeCause cause, const std::byte* at, std::uint32_t length,
                                std::uint32_t detail);
  std::unexpected<Failure> failIllFormed(std::string_view text, std::size_t wellFormed);
  std::unexpected<Failure> failTooDeep();

  Result keepUnknown(UnknownStorage& unknownFields);
  Result readLongTag();
  BinaryDecoder& outermost();

  WireReader reader_;
  const std::byte* readableEnd_;                // of the whole input
  const std::byte* recordStart_ = nothing;      // of the field whose number was given last
  const std::byte* valueStart_ = nothing;       // of that field, unless there is none
  const MessageDescriptor* message_ = nullptr;  // the type of the message that is being read
  BinaryDecoder* outer_ = nullptr;              // who reads the enclosing message
  Tag tag_{0};
  std::uint8_t nesting_ = 0;
  Mode mode_ = Mode::careful;

  // The outermost decoder's alone.
  const std::byte* begin_ = nullptr;
  ConflictHook hook_;

  // What became of the outermost decoder; meaningless until something failed. The parts of the error stand
  // here one by one and become a DecodeError where the caller wants it: put together and then copied, they
  // take twice as long.
  WireFault fault_;
  std::array<std::uint32_t, FieldPath::capacity> numbers_;
  std::uint8_t depth_;
  std::optional<DecodeError> refusal_;  // the hook's own error
};

}  // namespace orv
