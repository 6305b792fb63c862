// Reads the text format of Protocol Buffers (protobuf.dev, "Text Format").
#pragma once

#include <expected>
#include <string>
#include <string_view>

#include <orv/spelling/text_position.hpp>
#include "tools/orv/messages/message_type.hpp"

namespace orv::tool {

// proto/orv.proto, as it was when the command was built: for peers in other languages.
std::string_view schema();

// The binary encoding of a message that is given in the text format. An envelope's data may be its payload as a
// message, or its bytes as a string. Unknown fields go by their numbers: what TextRenderer writes is read again,
// where it was told to write nothing else.
std::expected<std::string, spelling::TextError> encodeTextForm(const MessageType& type, std::string_view text,
                                                               const PayloadPairing& payloads);

}  // namespace orv::tool
