// The built-in decoder's position in its input, and all that it does there.
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
#include <variant>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/conflict_hook.hpp>
#include <orv/decode_error.hpp>
#include <orv/decode_limits.hpp>
#include <orv/descriptor.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/internal/presence.hpp>
#include <orv/internal/step.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/utf8.hpp>
#include <orv/wire_reader.hpp>

namespace orv::inline v0::internal {

// Where a message stands that is being read. It is written once a message and read where an error is put
// together, or a hook asked.
struct Frame {
  // What becomes of the message if its reading fails.
  enum class Mode : std::uint8_t {
    careful,    // it keeps what was read, so a nested message is checked before it is merged into one there
    checking,   // it is dropped, so nothing need be checked
    confirmed,  // it cannot fail: all of it was read once before, and the hook was asked then
  };

  Frame* outer = nullptr;    // of the enclosing message
  std::uint32_t number = 0;  // of the field of that message
  // How many messages it is in; where a limit allows fewer than maximumNesting, the outermost one begins with the
  // difference.
  std::uint8_t nesting = 0;
  Mode mode = Mode::careful;
};

// The frame of the outermost message, and what all of its reading shares.
struct OutermostFrame : Frame {
  OutermostFrame(const std::byte* begin, ConflictHook hook) : inputBegin(begin), conflictHook(hook) {}
  OutermostFrame(std::span<const std::byte> input, ConflictHook hook, const DecodeLimits& limits);

  // Whether the input is larger than a limit allows: a fault, and nothing may be read.
  bool refusesInput() const { return isInputTooLarge; }

  // Puts together what was wrong. Only after a failure.
  void describe(DecodeError& error) const;

  // What may still be given room for.
  struct Allowance {
    std::size_t listElements = std::numeric_limits<std::size_t>::max();
    std::size_t unknownFieldBytes = std::numeric_limits<std::size_t>::max();
  };

  const std::byte* inputBegin;
  ConflictHook conflictHook;
  Allowance allowance;
  bool isInputTooLarge = false;
  const MessageDescriptor* outermostMessage = nullptr;

  // What ended the reading. The parts of a fault stand here one by one and become a DecodeError where the
  // caller wants it; they are meaningless until then.
  enum class End : std::uint8_t { none, fault, refusal } end = End::none;
  DecodeCause cause;
  std::uint8_t depth;
  std::uint32_t length;
  std::uint32_t detail;
  const std::byte* at;
  std::array<std::uint32_t, FieldPath::capacity> numbers;
  std::optional<DecodeError> refusal;  // the hook's own error
};

class FieldReader;

// Reads a message's fields: what the rules make of decodeMessage.
struct DecodeMessage {
  template <class M>
  [[gnu::always_inline]] Step operator()(M& message, FieldReader& reader) const {
    return message.decodeMessage(reader);
  }
};

// Reads one message: a decoder that is a plain value. As long as nobody has a pointer to it, the compiler
// keeps it in registers; therefore all that is inlined here is short, and all else is a static function that
// takes the parts which it needs and answers a new position. docs/decisions/position-in-registers.md.
class FieldReader {
 public:
  using Error = Failed;
  using Result = Step;
  using NextFieldNumber = NextNumber;

  // `readableEnd` is where the whole input ends. The frame outlives the reader.
  FieldReader(std::span<const std::byte> body, const std::byte* readableEnd, Frame& frame)
      : at_(body.data()), end_(body.data() + body.size()), readableEnd_(readableEnd), frame_(&frame) {}

  // The operations that Decoder lists.

  template <class M>
  [[gnu::always_inline]] NextNumber nextFieldNumber(M& message) {
    if (!isTaken_) [[unlikely]] {
      at_ = keepUnknown({recordStart_, at_, end_}, tag_, *frame_, M::descriptor(),
                        message.mutableUnknownFields());
      if (at_ == nullptr) return std::unexpected(Failed());
    }
    isTaken_ = true;
    if (at_ == end_) return NextNumber(0);
    recordStart_ = at_;
    const auto first = std::to_integer<std::uint32_t>(*at_);
    if (isShortTag(first)) [[likely]] {
      tag_ = Tag{first};
      ++at_;
    } else {
      const Read<Tag> read = readLongTag(at_, end_, *frame_);
      if (read.at == nullptr) return std::unexpected(Failed());
      tag_ = read.value;
      at_ = read.at;
    }
    isTaken_ = false;
    return NextNumber(tag_.fieldNumber());
  }

  [[gnu::always_inline]] Step decodeSingularStringField(Text& value) { return readText(value); }
  [[gnu::always_inline]] Step decodeSingularStringField(std::optional<Text>& value) {
    return readText(value);
  }
  [[gnu::always_inline]] Step decodeSingularBytesField(ByteBuffer& value) { return readBytes(value); }
  [[gnu::always_inline]] Step decodeSingularBytesField(std::optional<ByteBuffer>& value) {
    return readBytes(value);
  }
  // Any number but 0 is true.
  [[gnu::always_inline]] Step decodeSingularBoolField(bool& value) {
    return readVarint([&](std::uint64_t varint) { value = varint != 0; });
  }
  [[gnu::always_inline]] Step decodeSingularBoolField(std::optional<bool>& value) {
    return readVarint([&](std::uint64_t varint) { value = varint != 0; });
  }
  // The low 32 bits of the varint.
  [[gnu::always_inline]] Step decodeSingularUInt32Field(std::optional<std::uint32_t>& value) {
    return readVarint([&](std::uint64_t varint) { value = static_cast<std::uint32_t>(varint); });
  }
  // The low 32 bits of the varint as a signed number.
  template <class Enumeration>
  [[gnu::always_inline]] Step decodeSingularEnumField(std::optional<Enumeration>& value) {
    return readVarint([&](std::uint64_t varint) { value = Enumeration(static_cast<std::int32_t>(varint)); });
  }

  // A failed read leaves the slot as it was: absent, or holding what it held.
  template <class M>
  [[gnu::always_inline]] Step decodeSingularMessageField(std::optional<M>& slot) {
    if (!isAtLengthDelimited()) return {};
    if (slot.has_value()) return mergeChecked(*slot);
    Step read = readMessage(slot.emplace(), frame_->mode);
    if (!read) [[unlikely]]
      slot.reset();
    return read;
  }

  [[gnu::always_inline]] Step decodeRepeatedStringField(std::vector<Text>& texts) {
    if (!isAtLengthDelimited()) return {};
    if (!makeRoom(texts)) return std::unexpected(Failed());
    Step read = readText(texts.emplace_back());
    if (!read) [[unlikely]]
      texts.pop_back();
    return read;
  }

  template <class M>
  [[gnu::always_inline]] Step decodeRepeatedMessageField(std::vector<M>& messages) {
    if (!isAtLengthDelimited()) return {};
    if (!makeRoom(messages)) return std::unexpected(Failed());
    prefetchBehind(messages);
    Step read = readMessage(messages.emplace_back(), frame_->mode);
    if (!read) [[unlikely]]
      messages.pop_back();
    return read;
  }

  Step handleConflictingOneOf() { return askHook(*frame_); }  // not covered: decodeCase asks itself

  // One occurrence of a oneof member, in place wherever that is possible: a repeated member is not copied,
  // which with many repeats is the difference between linear and quadratic time.
  template <class Case, class... Cases>
  [[gnu::always_inline]] Step decodeCase(std::optional<std::variant<Cases...>>& group) {
    if (!group.has_value()) [[likely]] {
      if (!isAtLengthDelimited()) return {};
      Step read = readMessage(std::get<Case>(group.emplace(std::in_place_type<Case>)), frame_->mode);
      if (!read) [[unlikely]]
        group.reset();
      return read;
    }
    const std::byte* const after = replaceCase<Case>(parts(), *group);
    return continueAt(after);
  }

  // What only reparse needs, which takes the first occurrence of each field as if the message were empty.

  bool isAtLengthDelimited() const { return tag_.wireType() == WireType::lengthDelimited; }
  // Whether the field whose number was given last was taken.
  bool hasTakenField() const { return isTaken_; }

  // Reads the field, a message, by `read`, which is given a reader for it: inside the loop of the enclosing
  // message if it nests none, else by a call.
  template <class M, class Read>
  [[gnu::always_inline]] Step readMessageBy(M& message, Frame::Mode mode, Read read) {
    const std::span<const std::byte> body = takeBody();
    if (body.data() == nullptr) [[unlikely]]
      return std::unexpected(Failed());
    if (frame_->nesting == maximumNesting) [[unlikely]]
      return failTooDeep(recordStart_, *frame_, tag_);
    Frame frame{frame_, tag_.fieldNumber(), static_cast<std::uint8_t>(frame_->nesting + 1), mode};
    if constexpr (M::descriptor().nestsMessages()) {
      return readByCall(message, body, readableEnd_, frame, read);
    } else {
      FieldReader nested(body, readableEnd_, frame);
      return read(message, nested);
    }
  }
  Frame::Mode mode() const { return frame_->mode; }

 private:
  template <class T>
  struct Read {
    const std::byte* at;  // behind what was read; none if that failed
    T value;
  };

  // Bytes of the input: of the record that was begun last, and what is behind its tag.
  struct Place {
    const std::byte* record;
    const std::byte* value;
    const std::byte* end;
  };

  // All of a reader, for functions that are called.
  struct Parts {
    const std::byte* at;
    const std::byte* end;
    const std::byte* readableEnd;
    Frame* frame;
    const std::byte* recordStart;
    Tag tag;
  };
  Parts parts() const { return {at_, end_, readableEnd_, frame_, recordStart_, tag_}; }
  explicit FieldReader(const Parts& parts)
      : at_(parts.at),
        end_(parts.end),
        readableEnd_(parts.readableEnd),
        frame_(parts.frame),
        recordStart_(parts.recordStart),
        tag_(parts.tag),
        isTaken_(false) {}

  // A position that stands still means that the field was not taken.
  [[gnu::always_inline]] Step continueAt(const std::byte* after) {
    if (after == nullptr) [[unlikely]]
      return std::unexpected(Failed());
    isTaken_ = after != at_;
    at_ = after;
    return {};
  }

  [[gnu::always_inline]] Step takeUpTo(const std::byte* end) {
    at_ = end;
    isTaken_ = true;
    return {};
  }

  static bool isShortTag(std::uint32_t first) { return first - 8 < 0x80 - 8; }

  // Whether there are as many bytes of input from here on as fit inside an object.
  bool isReadableWithin(const std::byte* start) const {
    return readableEnd_ - start >= static_cast<std::ptrdiff_t>(InlineBytes::objectSize);
  }

  // The bytes behind a length that takes one byte, and all of them there: none otherwise.
  [[gnu::always_inline]] const std::byte* bodyEndIfShort() const {
    if (end_ - at_ < 1) [[unlikely]]
      return nullptr;
    const auto length = std::to_integer<std::size_t>(*at_);
    if (length >= 0x80 || length >= static_cast<std::size_t>(end_ - at_)) [[unlikely]]
      return nullptr;
    return at_ + 1 + length;
  }

  // The body of the length-delimited field, which becomes taken; its data is none if it cannot be read.
  [[gnu::always_inline]] std::span<const std::byte> takeBody() {
    std::span<const std::byte> body;
    if (const std::byte* const bodyEnd = bodyEndIfShort(); bodyEnd != nullptr) [[likely]] {
      body = std::span(at_ + 1, bodyEnd);
    } else {
      body = readLongBody(at_, end_, *frame_, tag_);
      if (body.data() == nullptr) [[unlikely]]
        return body;
    }
    at_ = body.data() + body.size();
    isTaken_ = true;
    return body;
  }

  template <class M>
  [[gnu::always_inline]] Step readMessage(M& message, Frame::Mode mode) {
    return readMessageBy(message, mode, DecodeMessage());
  }

  template <class M, class Read>
  [[gnu::noinline]] static Step readByCall(M& message, std::span<const std::byte> body,
                                           const std::byte* readableEnd, Frame& frame, Read read) {
    FieldReader reader(body, readableEnd, frame);
    return read(message, reader);
  }

  // Whether a message is checked before it is merged. Inside one that is dropped there is no need, but for a
  // hook, which is asked about what can be read alone.
  static bool isChecking(Frame& frame) {
    return frame.mode == Frame::Mode::careful ||
           (frame.mode == Frame::Mode::checking && outermost(frame).conflictHook.isSet());
  }

  template <class M>
  [[gnu::always_inline]] Step mergeChecked(M& held) {
    if (!isFieldSound(held, parts())) return std::unexpected(Failed());
    return readMessage(held, isChecking(*frame_) ? Frame::Mode::confirmed : frame_->mode);
  }

  // Whether the field could be merged into this message, which is not touched: reads it into another that is
  // then dropped, a copy of the one that is there if a oneof in it decides whether a hook is asked.
  template <class M>
  [[gnu::noinline]] static bool isFieldSound(const M& held, Parts parts) {
    if (!isChecking(*parts.frame)) return true;
    M scratch;
    if constexpr (M::descriptor().holdsOneof()) {
      if (outermost(*parts.frame).conflictHook.isSet()) scratch = held;
    }
    FieldReader reader(parts);
    // What is dropped is not charged.
    OutermostFrame& outermost = FieldReader::outermost(*parts.frame);
    const OutermostFrame::Allowance allowance = outermost.allowance;
    const bool isSound = static_cast<bool>(reader.readMessage(scratch, Frame::Mode::checking));
    outermost.allowance = allowance;
    return isSound;
  }

  // An occurrence of a oneof member while its group holds a case.
  template <class Case, class... Cases>
  [[gnu::noinline]] static const std::byte* replaceCase(Parts parts, std::variant<Cases...>& group) {
    FieldReader reader(parts);
    const bool isMessage = reader.isAtLengthDelimited();
    if (Case* const held = std::get_if<Case>(&group)) {
      if (isMessage && !isFieldSound(*held, parts)) return nullptr;
      if (!askHook(*parts.frame)) return nullptr;
      if (!isMessage) return parts.at;
      const auto mode = isChecking(*parts.frame) ? Frame::Mode::confirmed : parts.frame->mode;
      if (!reader.readMessage(*held, mode)) return nullptr;
      return reader.at_;
    }
    if (!isMessage) return parts.at;
    Case read;
    if (!reader.readMessage(read, parts.frame->mode) || !askHook(*parts.frame)) return nullptr;
    group.template emplace<Case>(std::move(read));
    return reader.at_;
  }

  template <class Slot>
  [[gnu::always_inline]] Step readText(Slot& slot) {
    if (!isAtLengthDelimited()) return {};
    if (const std::byte* const bodyEnd = bodyEndIfShort(); bodyEnd != nullptr) [[likely]] {
      const std::byte* const start = at_ + 1;
      const auto size = static_cast<std::size_t>(bodyEnd - start);
      // With more input behind it, a short text is checked and copied in steps of a fixed size.
      if (size <= InlineBytes::inlineCapacity) [[likely]] {
        if (isReadableWithin(start)) {
          if (InlineBytes::isAsciiWithin(start, size) || utf8::isWellFormedWithin(start, size)) [[likely]] {
            presentValue(slot).bytes_.assignWithin(start, size);
            return takeUpTo(bodyEnd);
          }
        } else if (takeShortText(slot, {reinterpret_cast<const char*>(start), size})) {
          return takeUpTo(bodyEnd);
        }
      }
    }
    const std::string_view text = readLongText(at_, end_, *frame_, tag_);
    if (text.data() == nullptr) [[unlikely]]
      return std::unexpected(Failed());
    presentValue(slot).bytes_.replace(text);
    return takeUpTo(reinterpret_cast<const std::byte*>(text.data() + text.size()));
  }

  // Whether it is well-formed; if not, the field stays as it was.
  [[gnu::noinline]] static bool takeShortText(Text& value, std::string_view text) {
    return value.bytes_.assignShortText(text);
  }
  [[gnu::noinline]] static bool takeShortText(std::optional<Text>& value, std::string_view text) {
    if (value.has_value()) return takeShortText(*value, text);
    if (takeShortText(value.emplace(), text)) [[likely]]
      return true;
    value.reset();
    return false;
  }

  template <class Slot>
  [[gnu::always_inline]] Step readBytes(Slot& slot) {
    if (!isAtLengthDelimited()) return {};
    const std::span<const std::byte> body = takeBody();
    if (body.data() == nullptr) [[unlikely]]
      return std::unexpected(Failed());
    InlineBytes& bytes = presentValue(slot).bytes_;
    if (body.size() <= InlineBytes::inlineCapacity && isReadableWithin(body.data())) [[likely]] {
      bytes.assignWithin(body.data(), body.size());
    } else {
      bytes.replace({reinterpret_cast<const char*>(body.data()), body.size()});
    }
    return {};
  }

  template <class Store>
  [[gnu::always_inline]] Step readVarint(Store store) {
    if (tag_.wireType() != WireType::varint) return {};
    if (at_ != end_ && *at_ < std::byte{0x80}) [[likely]] {
      store(std::to_integer<std::uint64_t>(*at_));
      ++at_;
    } else {
      const Read<std::uint64_t> read = readLongVarint(at_, end_, *frame_, tag_);
      if (read.at == nullptr) [[unlikely]]
        return std::unexpected(Failed());
      store(read.value);
      at_ = read.at;
    }
    isTaken_ = true;
    return {};
  }

  // Before an element is added to a full list: room for it and for the records of the same field that come later
  // in this message. A list is thus allocated twice at most: for its first few elements, so that an error among
  // them is found before all were counted, and then for all. One that each of many messages adds to is doubled, so
  // that the time stays in proportion. False if a limit allows no more.
  template <class T>
  [[gnu::always_inline, nodiscard]] bool makeRoom(std::vector<T>& list) const {
    if (list.size() == list.capacity()) [[unlikely]] {
      if (!grow(list, at_, end_, recordStart_, *frame_, tag_)) return false;
    }
    if (list.size() == list.capacity()) __builtin_unreachable();
    return true;
  }
  template <class T>
  [[gnu::noinline]] static bool grow(std::vector<T>& list, const std::byte* at, const std::byte* end,
                                     const std::byte* record, Frame& frame, Tag tag) {
    const std::size_t allowed =
        allowElements(list.size(), WireReader(std::span(at, end)), tag, outermost(frame));
    if (allowed == 0) {
      note(DecodeCause::tooManyElements, record, 0, 0, frame, tag.fieldNumber());
      return false;
    }
    list.reserve(list.size() + allowed);
    return true;
  }
  // How many elements room is made for; they are charged.
  static std::size_t allowElements(std::size_t held, WireReader input, Tag tag,
                                   OutermostFrame& outermost) noexcept;

  // The place of an element that comes later is fetched meanwhile: docs/decisions/long-lists.md.
  template <class T>
  [[gnu::always_inline]] static void prefetchBehind(const std::vector<T>& list) {
    constexpr std::size_t ahead = 16;
    __builtin_prefetch(list.data() + std::min(list.size() + ahead, list.capacity()), 1);
  }

  static OutermostFrame& outermost(Frame& frame) noexcept;
  static Step askHook(Frame& frame);

  // What is called when the common case does not hold. Each answers none after it has noted the fault.
  static const std::byte* keepUnknown(Place place, Tag tag, Frame& frame, const MessageDescriptor& message,
                                      UnknownStorage& unknownFields);
  static Read<Tag> readLongTag(const std::byte* at, const std::byte* end, Frame& frame) noexcept;
  static Read<std::uint64_t> readLongVarint(const std::byte* at, const std::byte* end, Frame& frame,
                                            Tag tag) noexcept;
  static std::span<const std::byte> readLongBody(const std::byte* at, const std::byte* end, Frame& frame,
                                                 Tag tag) noexcept;
  static std::string_view readLongText(const std::byte* at, const std::byte* end, Frame& frame,
                                       Tag tag) noexcept;
  static Step failTooDeep(const std::byte* record, Frame& frame, Tag tag) noexcept;
  static void note(DecodeCause cause, const std::byte* at, std::uint32_t length, std::uint32_t detail,
                   Frame& frame, std::uint32_t number) noexcept;
  static void note(const WireFault& fault, Frame& frame, std::uint32_t number) noexcept {
    note(fault.cause, fault.at, fault.length, fault.detail, frame, number);
  }

  const std::byte* at_;
  const std::byte* end_;          // of this message
  const std::byte* readableEnd_;  // of the whole input
  Frame* frame_;
  const std::byte* recordStart_ = nullptr;  // of the field whose number was given last
  Tag tag_{0};                              // of that field
  bool isTaken_ = true;                     // that field, or there is none
};

}  // namespace orv::internal
