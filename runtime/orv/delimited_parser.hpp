// Takes a stream of messages apart whose bytes are pushed into it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <memory>
#include <optional>
#include <span>
#include <utility>

#include <orv/byte_buffer.hpp>
#include <orv/decode_limits.hpp>
#include <orv/internal/standard.hpp>
#include <orv/stream_error.hpp>

namespace orv::inline v0 {

// What a DelimitedReader is for streams that must not be waited for: bytes are pushed as they come, in pieces
// of any size, and messages popped while there are any. That a read would block, or was interrupted, is
// nothing to it; that the stream has ended is said by finish.
//
//   parser.push(received);
//   for (auto message = parser.read<M>(); ; message = parser.read<M>()) …
//
// Memory grows with the bytes that were pushed and not popped. After a malformed message the next one can be
// read; after any other error every further call answers that error.
class DelimitedParser {
 public:
  // The limits are those of each message. One that is announced with more bytes than they allow is an error,
  // tooLarge.
  explicit DelimitedParser(const DecodeLimits& limits = {}) : limits_(limits) {}
  explicit DelimitedParser(std::size_t maximumSizeInBytes)
      : DelimitedParser(DecodeLimits{.inputBytes = maximumSizeInBytes}) {}

  // Takes a copy of the bytes that come next in the stream. They must not be the parser's own.
  void push(ByteView bytes);

  // The next message's bytes, which are valid until the next push; none where it has not arrived as a whole.
  [[nodiscard]] std::expected<std::optional<std::span<const std::byte>>, StreamError> next() ORV_BOUND;

  // As next, decoded. A message that cannot be decoded is an error, malformedMessage.
  template <class M>
  [[nodiscard]] std::expected<std::optional<M>, StreamError> read() {
    return decoded<M>(next());
  }

  // To be asked where the stream has ended and every message is popped: whether it ended between two messages.
  // If not, the error is truncated.
  [[nodiscard]] std::expected<void, StreamError> finish();

  // Where in the stream the message that was popped last begins, behind its length.
  std::uint64_t messageOffset() const { return messageOffset_; }

 private:
  friend class DelimitedReader;
  using Bytes = std::expected<std::optional<std::span<const std::byte>>, StreamError>;

  // The message that next answered.
  template <class M>
  std::expected<std::optional<M>, StreamError> decoded(const Bytes& bytes) const {
    if (!bytes) return std::unexpected(bytes.error());
    if (!bytes->has_value()) return std::nullopt;
    auto message = M::parse(**bytes, limits_);
    if (!message) return std::unexpected(malformedMessage(message.error()));
    return std::move(*message);
  }
  std::span<const std::byte> waiting() const { return {buffer_.get() + begin_, end_ - begin_}; }
  void makeRoom(std::size_t size);
  std::unexpected<StreamError> fail(StreamError::Cause cause, std::uint64_t length = 0);
  StreamError malformedMessage(const DecodeError& error) const;

  DecodeLimits limits_;
  // What was pushed and not popped stands from begin_ to end_.
  std::unique_ptr<std::byte[]> buffer_;
  std::size_t capacity_ = 0;
  std::size_t begin_ = 0;
  std::size_t end_ = 0;
  std::uint64_t offset_ = 0;  // of begin_ in the stream
  std::uint64_t messageOffset_ = 0;
  std::optional<StreamError> error_;
};

}  // namespace orv
