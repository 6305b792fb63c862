// Bytes as text of 64 characters (RFC 4648).
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace orv::json {

// Appends the standard alphabet's form, padded.
void appendBase64(std::string_view bytes, std::string& output);

// Takes both alphabets, with or without padding; nothing else, white space included. None for what is no
// base64.
std::optional<std::string> decodeBase64(std::string_view text);

}  // namespace orv::json
