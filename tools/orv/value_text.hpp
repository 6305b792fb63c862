// Values as a line of text for people.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace orv::tool {

// An offset in hexadecimal digits, at least four.
std::string hexOffset(std::uint64_t offset);

// "byte 12 (0x000c)"
std::string bytePlace(std::uint64_t offset);

// Whether the bytes are well-formed text without control characters.
bool isReadable(std::string_view bytes);

// Text in quotes on one line, with C escapes for what cannot be shown; cut where it is long, and then with
// its length. It begins with the byte `from`, which is no more than the text's size.
std::string quotedText(std::string_view utf8, std::size_t from = 0);

// Bytes as hexadecimal digits, cut where they are many, from the byte `from` on.
std::string hexText(std::string_view bytes, std::size_t from = 0);

}  // namespace orv::tool
