// Bytes spelled as text, taken in piece by piece.
#pragma once

#include <cstddef>
#include <expected>
#include <string>
#include <string_view>

namespace orv::tool {

// A character that cannot stand where it does; lines and columns count from 1.
struct SpellingFault {
  std::string reason;
  std::size_t line;
  std::size_t column;
};

// Where the next character stands.
class TextPosition {
 public:
  void advance(char character);
  std::size_t line() const { return line_; }
  std::size_t column() const { return column_; }

 private:
  std::size_t line_ = 1;
  std::size_t column_ = 1;
};

// Pairs of hexadecimal digits, with white space and "0x" between them.
class HexReader {
 public:
  // Appends the bytes that the piece completes.
  std::expected<void, SpellingFault> take(std::string_view piece, std::string& bytes);
  // There is no more.
  std::expected<void, SpellingFault> finish() const;

 private:
  std::unexpected<SpellingFault> failAt(char character) const;

  TextPosition position_;
  int half_ = -1;             // the first digit of a pair, after it was read
  bool mayBePrefix_ = false;  // that digit is a 0 at the start of a run
  bool isAtStart_ = true;     // no digit of this run was read yet
};

// Base64 with white space in it; padded runs may follow one another.
class Base64Reader {
 public:
  std::expected<void, SpellingFault> take(std::string_view piece, std::string& bytes);
  std::expected<void, SpellingFault> finish(std::string& bytes) const;

 private:
  std::unexpected<SpellingFault> failInGroup() const;

  TextPosition position_;
  TextPosition groupStart_;
  std::string group_;  // up to four digits
};

}  // namespace orv::tool
