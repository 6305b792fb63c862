// Reads streams of messages, each behind its length as a varint.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <utility>

#include <orv/decode_limits.hpp>
#include <orv/delimited_parser.hpp>
#include <orv/delimited_writer.hpp>
#include <orv/internal/standard.hpp>
#include <orv/stream_error.hpp>

namespace orv::inline v0 {

// Fills the front of a buffer from a file, a socket or the like. Answers how many bytes it put there, 0 at
// the end of the stream, and a negative number when reading failed. It may give fewer bytes than there is
// room for; an answer of more counts as a failure.
#ifdef __cpp_lib_move_only_function
using ReadFunction = std::move_only_function<std::ptrdiff_t(std::span<std::byte>)>;
#else  // libc++ 19
using ReadFunction = std::function<std::ptrdiff_t(std::span<std::byte>)>;
#endif

// Reads one message after the other. Memory grows with the bytes that have arrived, not with the lengths that
// are announced. After a malformed message the next one can be read; after any other error every further call
// answers that error, and after an exception of the allocator's or the read function's, readFailed. A
// reader that was moved from may only be assigned to or destroyed.
class DelimitedReader {
 public:
  static constexpr std::size_t defaultMaximumSize = DecodeLimits().inputBytes;

  // The limits are those of each message. One that is announced with more bytes than they allow is an error,
  // tooLarge.
  explicit DelimitedReader(ReadFunction read, const DecodeLimits& limits = {});
  DelimitedReader(ReadFunction read, std::size_t maximumSizeInBytes)
      : DelimitedReader(std::move(read), DecodeLimits{.inputBytes = maximumSizeInBytes}) {}
  DelimitedReader(DelimitedReader&&) noexcept;
  DelimitedReader& operator=(DelimitedReader&&) noexcept;
  ~DelimitedReader();

  // The next message's bytes, which are valid until the next call; none where the stream ends between two
  // messages.
  [[nodiscard]] std::expected<std::optional<std::span<const std::byte>>, StreamError> next() ORV_BOUND;

  // As next, decoded. A message that cannot be decoded is an error, malformedMessage.
  template <class M>
  [[nodiscard]] std::expected<std::optional<M>, StreamError> read() {
    return parser().decoded<M>(next());
  }

  // Where in the stream the message that was read last begins, behind its length.
  std::uint64_t messageOffset() const { return parser().messageOffset(); }

 private:
  class Source;

  const DelimitedParser& parser() const;

  std::unique_ptr<Source> source_;
};

}  // namespace orv
