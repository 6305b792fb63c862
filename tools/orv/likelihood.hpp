// How well bytes fit a message type.
#pragma once

#include <cstddef>
#include <expected>
#include <span>
#include <vector>

#include <orv/decode_error.hpp>
#include "tools/orv/message_type.hpp"

namespace orv::tool {

// A type that the bytes could be.
struct Candidate {
  const MessageType* type;
  // From 0 to 1: the share of the bytes that the type explains. Fields that are checked while they are read,
  // as messages and texts are, explain their bytes fully, bytes of any content half of theirs, unknown fields
  // nothing.
  double score;
  std::size_t knownFields;
  std::size_t unknownFields;
};

// The types that the bytes could be, the likeliest first; types that fit alike in the order of the protocol.
// The error is that of bytes that are no fields at all, whatever the type.
std::expected<std::vector<Candidate>, DecodeError> rankTypes(std::span<const std::byte> bytes);

}  // namespace orv::tool
