// Bytes as C escapes.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace orv::inline v0::spelling {

// The value of a hexadecimal digit; negative for another character.
constexpr int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// Reads an escape of C, of which the text begins with the backslash: \n and its kin, \12 in up to three octal
// digits, \xAB in up to two hexadecimal ones, and as UTF-8 \u20AC, also of both halves of a surrogate pair, and
// \U0001F600. Appends its bytes and answers how many characters it takes, 0 for what is no escape.
std::size_t takeEscape(std::string_view text, std::string& bytes);

}  // namespace orv::spelling
