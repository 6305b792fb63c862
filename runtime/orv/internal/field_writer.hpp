// The built-in encoder's position in its output, and all that it does there.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <expected>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/descriptor.hpp>
#include <orv/encode_error.hpp>
#include <orv/internal/inline_bytes.hpp>
#include <orv/internal/step.hpp>
#include <orv/internal/varint.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/wire_reader.hpp>

namespace orv::inline v0::internal {

// Where an encoding goes.
struct Target {
  // The format's lengths, and those of the libraries that read it, are signed 32-bit numbers.
  static constexpr std::size_t largestEncoding = std::numeric_limits<std::int32_t>::max();

  // How the number of a nested message's length bytes is guessed before the message is written.
  enum class Guesses : std::uint8_t {
    bold,     // right more often, but an unfinished encoding may take some bytes more than a finished one
    careful,  // one: an encoding fits where it fits exactly
  };

  char* begin;
  std::string* growing = nullptr;  // none: a buffer of a fixed size
  Guesses guessing = Guesses::bold;
  EncodeError error = EncodeError::bufferTooSmall;  // why a step failed, if one did
};

// Writes one message: a visitor that is a plain value. As long as nobody has a pointer to it, the compiler
// keeps it in registers; therefore all that is inlined here is short, and all else is a static function that
// takes the parts which it needs and answers a new position. docs/decisions/position-in-registers.md.
class FieldWriter {
 public:
  using Error = Failed;
  using Result = Step;

  FieldWriter(std::span<char> room, Target& target)
      : at_(room.data()), limit_(room.data() + room.size()), target_(&target) {}

  // The operations that Visitor lists.

  [[gnu::always_inline]] Step visitSingularStringField(const Text& value, std::uint32_t number) {
    return writeBytes(value.bytes_, number);
  }
  [[gnu::always_inline]] Step visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return writeBytes(value.bytes_, number);
  }
  [[gnu::always_inline]] Step visitSingularBoolField(bool value, std::uint32_t number) {
    return writeNumber(value ? 1 : 0, number);
  }
  [[gnu::always_inline]] Step visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return writeNumber(value, number);
  }
  // The low 32 bits of the raw value travel, sign-extended to 64: ten bytes for a negative one.
  template <class Enumeration>
  [[gnu::always_inline]] Step visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    return writeNumber(travellingValue(value.rawValue()), number);
  }

  template <class M>
  [[gnu::always_inline]] Step visitSingularMessageField(const M& message, std::uint32_t number) {
    const std::size_t likelySize = message.likelyEncodedSize();
    std::size_t lengthBytes = 1;
    if (likelySize >= shortVarints && target_->guessing == Target::Guesses::bold) [[unlikely]]
      lengthBytes = varintSize(likelySize);
    if constexpr (!M::descriptor().nestsMessages()) {
      return writeInPlace(message, number, lengthBytes);
    } else {
      return continueAt(writeByCall(message, number, lengthBytes, at_, limit_, *target_));
    }
  }

  [[gnu::always_inline]] Step visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) {
      if (Step written = writeBytes(text.bytes_, number); !written) return written;
    }
    return {};
  }

  template <class M>
  [[gnu::always_inline]] Step visitRepeatedMessageField(const std::vector<M>& messages,
                                                        std::uint32_t number) {
    // Each element is taken to need as many length bytes as the one before it.
    std::size_t lengthBytes = 1;
    for (const M& message : messages) {
      if (target_->guessing == Target::Guesses::careful) lengthBytes = 1;
      if (Step written = writeInPlace(message, number, lengthBytes); !written) return written;
    }
    return {};
  }

  [[gnu::always_inline]] Step visitUnknownFields(const UnknownStorage& unknownFields) {
    return continueAt(writeUnknown(unknownFields, at_, limit_, *target_));
  }

  char* position() const { return at_; }
  std::size_t room() const { return static_cast<std::size_t>(limit_ - at_); }

  // Clears what steps of a fixed size left behind the encoding in a caller's buffer, which may be parts of
  // other contents.
  void wipeOverrun() {
    constexpr std::size_t longest = InlineBytes::objectSize;
    if (room() >= longest) [[likely]] {
      std::memset(at_, 0, longest);
    } else if (room() != 0) {
      std::memset(at_, 0, room());
    }
  }

 private:
  // A position and how far there is room; the position is none after a failure.
  struct Place {
    char* at;
    char* limit;
  };

  // Tags of the field numbers 1 to 15 and varints below 128 take one byte, varints below 2^14 two.
  static constexpr std::uint32_t shortNumbers = 16;
  static constexpr std::uint64_t shortVarints = 0x80;
  static constexpr std::uint64_t mediumVarints = 0x4000;

  [[gnu::always_inline]] Step continueAt(Place place) {
    if (place.at == nullptr) [[unlikely]]
      return std::unexpected(Failed());
    at_ = place.at;
    limit_ = place.limit;
    return {};
  }

  static char shortTag(std::uint32_t number, WireType type) {
    return static_cast<char>(number << 3 | static_cast<std::uint32_t>(type));
  }

  // Where there is room enough, short contents are written in one step of a fixed size; what is behind them
  // is overwritten.
  [[gnu::always_inline]] Step writeBytes(const InlineBytes& bytes, std::uint32_t number) {
    char* const at = at_;
    if (number < shortNumbers && !bytes.isOnHeap() && room() >= 2 + InlineBytes::objectSize) [[likely]] {
      const std::string_view contents = bytes.view();
      at[0] = shortTag(number, WireType::lengthDelimited);
      at[1] = static_cast<char>(contents.size());
      std::memcpy(at + 2, contents.data(), InlineBytes::objectSize);
      at_ = at + 2 + contents.size();
      return {};
    }
    return continueAt(writeLongBytes(bytes.view(), number, at_, limit_, *target_));
  }

  [[gnu::always_inline]] Step writeNumber(std::uint64_t value, std::uint32_t number) {
    char* const at = at_;
    if (number < shortNumbers && value < shortVarints && room() >= 2) [[likely]] {
      at[0] = shortTag(number, WireType::varint);
      at[1] = static_cast<char>(value);
      at_ = at + 2;
      return {};
    }
    return continueAt(writeLongNumber(value, number, at_, limit_, *target_));
  }

  // Writes a nested message behind the given number of length bytes, and sets it to the number that it took.
  template <class M>
  [[gnu::always_inline]] Step writeInPlace(const M& message, std::uint32_t number, std::size_t& lengthBytes) {
    if (number < shortNumbers && room() > lengthBytes) [[likely]] {
      *at_ = shortTag(number, WireType::lengthDelimited);
      at_ += 1 + lengthBytes;
    } else if (Step begun = continueAt(beginLongNested(number, lengthBytes, at_, limit_, *target_)); !begun) {
      return begun;
    }
    // Where the output may move, a place in it is told by its distance.
    const auto start = static_cast<std::size_t>(at_ - target_->begin);
    if (Step walked = message.traverse(*this); !walked) [[unlikely]]
      return walked;
    char* const body = target_->begin + start;
    const auto length = static_cast<std::size_t>(at_ - body);
    if (lengthBytes == 1 && length < shortVarints) [[likely]] {
      body[-1] = static_cast<char>(length);
      return {};
    }
    if (lengthBytes == 2 && length >= shortVarints && length < mediumVarints) {
      body[-2] = static_cast<char>((length & 0x7F) | 0x80);
      body[-1] = static_cast<char>(length >> 7);
      return {};
    }
    const std::size_t guessed = lengthBytes;
    lengthBytes = varintSize(length);
    return continueAt(endLongNested(start, guessed, at_, limit_, *target_));
  }

  template <class M>
  [[gnu::noinline]] static Place writeByCall(const M& message, std::uint32_t number, std::size_t lengthBytes,
                                             char* at, char* limit, Target& target) {
    FieldWriter writer({at, limit}, target);
    if (!writer.writeInPlace(message, number, lengthBytes)) return {nullptr, nullptr};
    return {writer.at_, writer.limit_};
  }

  // What is called when the common case does not hold.
  static Place writeLongBytes(std::string_view bytes, std::uint32_t number, char* at, char* limit,
                              Target& target);
  static Place writeLongNumber(std::uint64_t value, std::uint32_t number, char* at, char* limit,
                               Target& target);
  static Place beginLongNested(std::uint32_t number, std::size_t lengthBytes, char* at, char* limit,
                               Target& target);
  static Place endLongNested(std::size_t start, std::size_t guessed, char* at, char* limit, Target& target);
  static Place writeUnknown(const UnknownStorage& unknownFields, char* at, char* limit, Target& target);
  static Place makeRoom(std::size_t size, char* at, char* limit, Target& target);

  char* at_;
  char* limit_;
  Target* target_;
};

}  // namespace orv::internal
