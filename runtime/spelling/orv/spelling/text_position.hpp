// Places in a text that is read piece by piece.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>

namespace orv::inline v0::spelling {

// Why a text cannot be read, and where; lines and columns count from 1.
struct TextError {
  std::string reason;
  std::size_t line;
  std::size_t column;

  // "line 3, column 7: reason"
  std::string message() const {
    return "line " + std::to_string(line) + ", column " + std::to_string(column) + ": " + reason;
  }
};

constexpr bool isSpace(char character) {
  return character == ' ' || character == '\t' || character == '\r' || character == '\n';
}

// Whether a byte of UTF-8 is the first of its character.
constexpr bool startsCharacter(char byte) { return (static_cast<unsigned char>(byte) & 0xC0) != 0x80; }

// Where the character begins that has the byte `at`.
constexpr std::size_t characterStart(std::string_view utf8, std::size_t at) {
  while (at > 0 && !startsCharacter(utf8[at])) --at;
  return at;
}

// Where the next character stands.
class TextPosition {
 public:
  TextPosition() = default;
  TextPosition(std::size_t line, std::size_t column) : line_(line), column_(column) {}

  void advance(char character) {
    if (character == '\n') {
      ++line_;
      column_ = 1;
    } else if (startsCharacter(character)) {
      ++column_;
    }
  }

  // Both count from 1, columns in characters.
  std::size_t line() const { return line_; }
  std::size_t column() const { return column_; }

  TextError error(std::string reason) const { return {std::move(reason), line_, column_}; }

 private:
  std::size_t line_ = 1;
  std::size_t column_ = 1;
};

}  // namespace orv::spelling
