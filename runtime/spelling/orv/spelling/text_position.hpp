// Places in a text that is read piece by piece.
#pragma once

#include <cstddef>
#include <string>
#include <utility>

namespace orv::spelling {

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

// Where the next character stands.
class TextPosition {
 public:
  void advance(char character) {
    if (character == '\n') {
      ++line_;
      column_ = 1;
    } else if ((static_cast<unsigned char>(character) & 0xC0) != 0x80) {  // not inside a character
      ++column_;
    }
  }

  TextError error(std::string reason) const { return {std::move(reason), line_, column_}; }

 private:
  std::size_t line_ = 1;
  std::size_t column_ = 1;
};

}  // namespace orv::spelling
