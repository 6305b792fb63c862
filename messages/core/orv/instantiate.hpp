// What messages can do with the built-in decoder and visitors. Whoever writes a message includes this in the
// source that compiles it, once for each type:
//
//   template class orv::Message<MyMessage>;
//
// Whoever includes a message's header then compiles none of it.
#pragma once

#include <algorithm>
#include <array>
#include <cassert>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <limits>
#include <span>
#include <string>

#include <orv/binary_decoder.hpp>
#include <orv/binary_encoder.hpp>
#include <orv/hash_visitor.hpp>
#include <orv/internal/printing.hpp>
#include <orv/internal/replacing.hpp>
#include <orv/message.hpp>
#include <orv/size_counter.hpp>
#include <orv/text_renderer.hpp>

namespace orv::inline v0 {

namespace internal {

// The loop over all of an input, once for each message type and way of reading.
template <class Read, class M>
[[gnu::noinline]] bool readAll(M& message, std::span<const std::byte> bytes, OutermostFrame& frame) {
  FieldReader reader(bytes, bytes.data() + bytes.size(), frame);
  return static_cast<bool>(Read()(message, reader));
}

template <class Read, class M>
[[gnu::always_inline]] inline std::expected<void, DecodeError> readInto(M& message,
                                                                        std::span<const std::byte> bytes,
                                                                        OutermostFrame&& frame) {
  std::expected<void, DecodeError> result;
  frame.outermostMessage = &M::descriptor();
  if (frame.refusesInput() || !readAll<Read>(message, bytes, frame)) [[unlikely]] {
    result = std::unexpected(DecodeError());
    frame.describe(result.error());
  }
  return result;
}

// The oneofs of a message that hold nothing before it is read into. Where memory runs out they hold nothing again,
// and not a part of a payload. In the functions that are called, not in the loop, which an exception's way out of it
// would slow down (docs/decisions/exception-neutral.md).
template <class Table, class M>
class UnsetOneofs {
 public:
  explicit UnsetOneofs(M& message) : message_(message) {
    forEachOneof([&](const auto& group, std::size_t index) { areSet_[index] = group.has_value(); });
  }
  UnsetOneofs(const UnsetOneofs&) = delete;
  UnsetOneofs& operator=(const UnsetOneofs&) = delete;
  ~UnsetOneofs() {
    if (hasReturned_) [[likely]]
      return;
    forEachOneof([&](auto& group, std::size_t index) {
      if (!areSet_[index]) group.reset();
    });
  }

  template <class Result>
  Result afterReturn(Result result) {
    hasReturned_ = true;
    return result;
  }

 private:
  void forEachOneof(auto visit) {
    Table::forEachIndex([&]<std::size_t index>() {
      if constexpr (Table::template isCase<index> && Table::template isFirstRow<index>)
        visit(Table::template storage<index>(message_), index);
    });
  }

  M& message_;
  std::array<bool, Table::size> areSet_;
  bool hasReturned_ = false;
};

// A message on one line, behind its name.
template <class M>
std::string lineOf(const M& message, TextStyle style) {
  std::string line = std::string(M::protoMessageName) + " { ";
  TextRenderer renderer(line, style);
  (void)message.traverse(renderer);
  if (!renderer.isCut()) line += '}';
  return line;
}

// The walk over a whole message, once for each type. Answers the encoding's size, or that it does not fit.
inline constexpr std::size_t doesNotFit = std::numeric_limits<std::size_t>::max();
template <class M>
[[gnu::noinline]] std::size_t writeAll(const M& message, std::span<char> room, Target& target) {
  FieldWriter writer(room, target);
  if (!message.traverse(writer)) [[unlikely]]
    return doesNotFit;
  writer.wipeOverrun();
  return static_cast<std::size_t>(writer.position() - room.data());
}

}  // namespace internal

template <class M>
M& Message<M>::assign(const M& other) {
  if (this != &other) assign(M(other));
  return self();
}

template <class M>
std::expected<void, DecodeError> Message<M>::decodeMessage(BinaryDecoder& decoder) {
  internal::UnsetOneofs<Table<M>, M> unset(self());
  return unset.afterReturn(decoder.readWith(self(), internal::DecodeMessage()));
}

template <class M>
std::expected<void, EncodeError> Message<M>::traverse(BinaryEncoder& visitor) const {
  return visitor.writeWith([&](internal::FieldWriter& writer) { return traverse(writer); });
}

template <class M>
std::expected<void, NeverFails> Message<M>::traverse(SizeCounter& visitor) const {
  return internal::visitFields<Table<M>>(self(), visitor);
}

template <class M>
std::expected<void, NeverFails> Message<M>::traverse(HashVisitor& visitor) const {
  return internal::visitFields<Table<M>>(self(), visitor);
}

template <class M>
std::expected<void, NeverFails> Message<M>::traverse(TextRenderer& visitor) const {
  return internal::visitFields<Table<M>>(self(), visitor);
}

template <class M>
std::weak_ordering Message<M>::order(const M& other) const {
  const std::weak_ordering order = internal::orderOfFields<Table<M>>(self(), other);
  if (order != 0) return order;
  return ByteView(unknownFields_.records()).characters() <=>
         ByteView(other.unknownFields_.records()).characters();
}

template <class M>
void Message<M>::hash(Hasher& into) const {
  HashVisitor visitor(into);
  (void)traverse(visitor);
}

template <class M>
std::uint64_t Message<M>::hashValue() const {
  Hasher hasher;
  hash(hasher);
  return hasher.finish();
}

template <class M>
std::string Message<M>::debugDescription() const {
  std::string text;
  TextRenderer renderer(text);
  (void)traverse(renderer);
  return text;
}

template <class M>
void Message<M>::print(std::ostream& out) const {
  internal::print(out, internal::lineOf(self(), {.isOneLine = true, .maximumSizeInBytes = longestLine}));
}

template <class M>
std::string Message<M>::redactedDescription(std::size_t maximumSizeInBytes) const {
  return internal::lineOf(
      self(), {.isOneLine = true, .hidesSecrets = true, .maximumSizeInBytes = maximumSizeInBytes});
}

template <class M>
std::expected<M, DecodeError> Message<M>::parse(ByteView bytes) {
  return parseIn(bytes.bytes(), internal::OutermostFrame(bytes.bytes().data(), {}));
}

template <class M>
std::expected<M, DecodeError> Message<M>::parse(ByteView bytes, const DecodeLimits& limits) {
  return parseIn(bytes.bytes(), internal::OutermostFrame(bytes.bytes(), {}, limits));
}

template <class M>
[[gnu::always_inline]] inline std::expected<M, DecodeError> Message<M>::parseIn(
    std::span<const std::byte> bytes, internal::OutermostFrame&& frame) {
  std::expected<M, DecodeError> message;
  frame.outermostMessage = &M::descriptor();
  if (frame.refusesInput() || !internal::readAll<internal::DecodeMessage>(*message, bytes, frame))
      [[unlikely]] {
    message = std::unexpected(DecodeError());
    frame.describe(message.error());
  }
  return message;
}

template <class M>
std::expected<void, DecodeError> Message<M>::reparse(ByteView bytes) {
  return internal::readInto<internal::Replace>(self(), bytes.bytes(),
                                               internal::OutermostFrame(bytes.bytes().data(), {}));
}

template <class M>
std::expected<void, DecodeError> Message<M>::reparse(ByteView bytes, const DecodeLimits& limits) {
  return internal::readInto<internal::Replace>(self(), bytes.bytes(),
                                               internal::OutermostFrame(bytes.bytes(), {}, limits));
}

template <class M>
template <class Reader>
[[gnu::always_inline]] inline internal::Step Message<M>::replaceMessage(M& message, Reader& reader) {
  message.mutableUnknownFields().clear();
  return internal::Replacing<Table<M>, M>(message).read(reader);
}

template <class M>
std::expected<void, DecodeError> Message<M>::merge(ByteView bytes) {
  internal::UnsetOneofs<Table<M>, M> unset(self());
  return unset.afterReturn(internal::readInto<internal::DecodeMessage>(
      self(), bytes.bytes(), internal::OutermostFrame(bytes.bytes().data(), {})));
}

template <class M>
std::expected<void, DecodeError> Message<M>::merge(ByteView bytes, const DecodeLimits& limits) {
  internal::UnsetOneofs<Table<M>, M> unset(self());
  return unset.afterReturn(internal::readInto<internal::DecodeMessage>(
      self(), bytes.bytes(), internal::OutermostFrame(bytes.bytes(), {}, limits)));
}

template <class M>
std::expected<std::string, EncodeError> Message<M>::serialize() const {
  // Most messages are written here first, and then their string is allocated once, at its final size. Where
  // much of a message is long contents, counting it costs less than copying it once more.
  std::array<char, 16 << 10> buffer;
  constexpr std::size_t most = M::descriptor().nestsMessages() ? std::tuple_size_v<decltype(buffer)> : 192;
  if (likelyEncodedSize() < most) [[likely]] {
    internal::Target target{.begin = buffer.data()};
    if (const std::size_t size = internal::writeAll(self(), buffer, target); size != internal::doesNotFit)
        [[likely]]
      return std::expected<std::string, EncodeError>(std::in_place, buffer.data(), size);
  }
  // Bold guesses need some room beyond the encoding.
  constexpr std::size_t slack = 8;
  const std::size_t size = encodedSize();
  if (size > BinaryEncoder::largestEncoding)
    return std::unexpected(EncodeError::tooLarge);  // not covered: by orv_size_tests
  std::expected<std::string, EncodeError> bytes;
  bytes->resize_and_overwrite(size + slack, [&](char* begin, std::size_t room) {
    const auto written = serializeInto(std::as_writable_bytes(std::span(begin, room)));
    assert(written == size);
    return written.value_or(0);
  });
  return bytes;
}

template <class M>
std::expected<std::size_t, EncodeError> Message<M>::serializeInto(std::span<std::byte> buffer) const {
  char* const begin = reinterpret_cast<char*>(buffer.data());
  const std::span room(begin, std::min(buffer.size(), BinaryEncoder::largestEncoding));
  internal::Target target{.begin = begin};
  std::size_t size = internal::writeAll(self(), room, target);
  if (size == internal::doesNotFit) [[unlikely]] {
    // It may have been a bold guess that took too much room.
    target.guessing = internal::Target::Guesses::careful;
    size = internal::writeAll(self(), room, target);
  }
  if (size == internal::doesNotFit) [[unlikely]] {
    std::ranges::fill(buffer, std::byte{0});
    return std::unexpected(target.error);
  }
  return size;
}

template <class M>
std::size_t Message<M>::encodedSize() const {
  SizeCounter counter;
  (void)traverse(counter);
  return static_cast<std::size_t>(counter.size());  // no encoding is larger than its message in memory
}

}  // namespace orv
