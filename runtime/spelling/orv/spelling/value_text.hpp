// Values as a line of text for people.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace orv::inline v0::spelling {

// Whether the bytes are well-formed text that a terminal shows as it is: without controls, without characters
// that turn the direction of writing or are not seen.
bool isReadable(std::string_view bytes);

// Text from outside for people, on one line: what is not readable in it becomes \x escapes, byte by byte.
std::string printable(std::string_view text);

// Text in quotes on one line, with C escapes for what cannot be shown; cut where it is long, and then with
// its length. It begins with the byte `from`, which is no more than the text's size.
std::string quotedText(std::string_view utf8, std::size_t from = 0);

// Bytes as hexadecimal digits, cut where they are many, from the byte `from` on.
std::string hexText(std::string_view bytes, std::size_t from = 0);

}  // namespace orv::spelling
