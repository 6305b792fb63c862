// Reads messages from their binary encoding.
#pragma once

#include <cstddef>
#include <expected>

#include <orv/byte_buffer.hpp>
#include <orv/conflict_hook.hpp>
#include <orv/decode_error.hpp>
#include <orv/decode_limits.hpp>
#include <orv/internal/field_reader.hpp>

namespace orv::inline v0 {

// Reads one message from bytes that lie in one stretch of memory and outlive the decoder:
//
//   BinaryDecoder decoder(bytes);
//   const auto result = message.decodeMessage(decoder);
//
// (parse and merge are the same in one call.) Decoding n bytes takes time and memory in proportion to n,
// whatever they are; how much of each, limits say. decodeMessage fails with a DecodeError: what is wrong, at which byte, in which field.
//
// It has the operations that Decoder lists, for decoders that hand on to it. They answer only whether they
// succeeded; error() says what was wrong.
class BinaryDecoder : private internal::OutermostFrame, public internal::FieldReader {
 public:
  explicit BinaryDecoder(ByteView input ORV_BOUND, ConflictHook hook = {})
      : OutermostFrame(input.bytes().data(), hook),
        FieldReader(input.bytes(), input.bytes().data() + input.size(), *this) {}
  BinaryDecoder(ByteView input ORV_BOUND, const DecodeLimits& limits, ConflictHook hook = {})
      : OutermostFrame(input.bytes(), hook, limits),
        FieldReader(input.bytes(), input.bytes().data() + input.size(), *this) {}
  BinaryDecoder(const BinaryDecoder&) = delete;
  BinaryDecoder& operator=(const BinaryDecoder&) = delete;

  template <class M>
  internal::NextNumber nextFieldNumber(M& message) {
    outermostMessage = &M::descriptor();
    if (refusesInput()) [[unlikely]]
      return std::unexpected(internal::Failed());
    return FieldReader::nextFieldNumber(message);
  }

  // What was wrong. Only for a decoder one of whose operations failed.
  DecodeError error() const {
    DecodeError error;
    describe(error);
    return error;
  }

  // Runs `read` on a reader that goes on where this decoder stands, and then stands where that one ended.
  // This is how the rules of all messages read with a decoder that the compiler can keep in registers.
  template <class M, class Read>
  std::expected<void, DecodeError> readWith(M& message, Read read) {
    outermostMessage = &M::descriptor();
    if (refusesInput()) [[unlikely]]
      return std::unexpected(error());
    FieldReader reader = static_cast<const FieldReader&>(*this);
    const bool isRead = static_cast<bool>(read(message, reader));
    static_cast<FieldReader&>(*this) = reader;
    if (isRead) return {};
    return std::unexpected(error());
  }
};

}  // namespace orv
