// Hexadecimal digits.
#pragma once

#include <expected>
#include <string>
#include <string_view>

#include <orv/internal/hex_digits.hpp>
#include <orv/spelling/text_position.hpp>

namespace orv::inline v0::spelling {

// Appends two lower-case digits for each byte, with `between` between two bytes.
void appendHex(std::string_view bytes, std::string& output, std::string_view between = {});

using internal::hexNumber;

// Reads pairs of hexadecimal digits, with white space and "0x" between them, piece by piece.
class HexReader {
 public:
  // Appends the bytes that the piece completes.
  std::expected<void, TextError> take(std::string_view piece, std::string& bytes);
  // There is no more.
  std::expected<void, TextError> finish(std::string& bytes);

 private:
  std::unexpected<TextError> failAt(char character) const;

  TextPosition position_;
  int half_ = -1;             // the first digit of a pair, after it was read
  bool mayBePrefix_ = false;  // that digit is a 0 at the start of a run
  bool isAtStart_ = true;     // no digit of this run was read yet
};

}  // namespace orv::spelling
