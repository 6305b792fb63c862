// Reads the text format of Protocol Buffers. Behind this header stands the whole of libprotobuf.
#pragma once

#include <expected>
#include <string>
#include <string_view>

#include <orv/spelling/text_position.hpp>
#include "tools/orv/messages/message_type.hpp"

namespace orv::tool {

// proto/orv.proto, as it was when the command was built: for peers in other languages, and for the text format.
std::string_view schema();

// The binary encoding of a message that is given in the text format, by libprotobuf's own parser and the
// schema. An envelope's data may be its payload as a message, or its bytes as a string.
std::expected<std::string, spelling::TextError> encodeTextForm(const MessageType& type, std::string_view text,
                                                               const PayloadPairing& payloads);

}  // namespace orv::tool
