// Reads the text format of Protocol Buffers.
#pragma once

#include <cstddef>
#include <expected>
#include <string>
#include <string_view>

#include "tools/orv/message_type.hpp"
#include "tools/orv/payload.hpp"

namespace orv::tool {

// Why a text is no message; line and column count from 1.
struct TextFault {
  std::string reason;
  std::size_t line;
  std::size_t column;
};

// The binary encoding of a message that is given in the text format, by libprotobuf's own parser and the
// schema. An envelope's data may be its payload as a message, or its bytes as a string.
std::expected<std::string, TextFault> encodeTextForm(const MessageType& type, std::string_view text,
                                                     const PayloadPairing& payloads);

}  // namespace orv::tool
