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

// How many columns a terminal shows the text in: wide characters take two, combining ones none.
std::size_t columns(std::string_view utf8);

// As much of the text's start as so many columns hold.
std::string_view startWithin(std::string_view utf8, std::size_t room);

// Text in quotes on one line, with C escapes for what cannot be shown; cut where it is long, and then with
// its length. It begins with the byte `from`, which is no more than the text's size.
std::string quotedText(std::string_view utf8, std::size_t from = 0);
void appendQuotedText(std::string_view utf8, std::string& output, std::size_t from = 0);

// Bytes as hexadecimal digits, cut where they are many, from the byte `from` on.
std::string hexText(std::string_view bytes, std::size_t from = 0);

}  // namespace orv::spelling
