// Why no message could be read from a stream.
#pragma once

#include <cstdint>
#include <iosfwd>
#include <optional>
#include <string>
#include <string_view>

#include <orv/decode_error.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

// Why no message could be read from a stream.
struct StreamError {
  enum class Cause : std::uint8_t {
    readFailed,        // the read function answered a negative number, or more than there was room for
    truncated,         // the stream ends inside a length or a message
    malformedLength,   // a length of 2^31 or more, or spelled in more than five bytes
    tooLarge,          // a length above the reader's limit
    malformedMessage,  // decodeError says why
  };

  Cause cause;
  // Where in the stream the piece begins that could not be read.
  std::uint64_t offset = 0;
  // For tooLarge: the length that the stream announces.
  std::uint64_t length = 0;
  // For malformedMessage; its own offset counts from the message's first byte.
  std::optional<DecodeError> decodeError{};

  // What is wrong, without path and offset: "the stream ends inside a message".
  std::string reason() const;
  // All of it: "the stream ends inside a message, at byte 12".
  std::string message() const;

  friend bool operator==(const StreamError&, const StreamError&) = default;
  friend std::ostream& operator<<(std::ostream& out, const StreamError& error);
};

// A sentence without its full stop. It lasts as long as the program.
std::string_view describe(StreamError::Cause cause);
std::ostream& operator<<(std::ostream& out, StreamError::Cause cause);

}  // namespace orv

template <>
class std::bad_expected_access<orv::StreamError> : public orv::internal::BadAccess<orv::StreamError> {
  using BadAccess::BadAccess;
};
