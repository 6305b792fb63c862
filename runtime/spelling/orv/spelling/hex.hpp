// Hexadecimal digits.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <string>
#include <string_view>

#include <orv/internal/hex_digits.hpp>
#include <orv/spelling/text_position.hpp>

namespace orv::inline v0::spelling {

// Appends two lower-case digits for each byte, with `between` between two bytes.
void appendHex(std::string_view bytes, std::string& output, std::string_view between = {});

using internal::hexNumber;

// Reads bytes out of whatever is at hand, piece by piece:
//
//   0801 10, 08:01:10, 0x08, 0x01, \x08\x01     pairs of digits and what stands between them
//   unsigned char message[] = {0x08, 0x01};      what stands in the braces
//   "\010\001\020" or b'\x08\x01\x10'            strings with C escapes, \010 without quotation marks too
//   00000000: 0801 1005 1a0c  ......             xxd, tcpdump -x
//   00000000  08 01 10 05 1a 0c  |......|        hexdump -C, od -tx1, Wireshark
class HexReader {
 public:
  // Appends the bytes of the lines that the piece completes, and of long ones as far as they are there.
  std::expected<void, TextError> take(std::string_view piece, std::string& bytes);
  // There is no more: appends what is left.
  std::expected<void, TextError> finish(std::string& bytes);

 private:
  using Taken = std::expected<void, TextError>;

  // Whether lines begin with an offset, and what ends it.
  enum class Layout : std::uint8_t { unknown, withoutOffsets, colon, blank };

  // Takes what stands before `end`, in pieces that may reach a little further.
  Taken takeUpTo(std::size_t end, std::string& bytes);
  Taken takeLineStart();
  Taken takeInString(std::string& bytes);
  Taken takeEscapeOf(std::string& bytes);
  Taken takeDigits(std::string& bytes);
  std::unexpected<TextError> failAt(std::size_t at, std::string reason) const;

  TextPosition position_;  // of text_
  std::string text_;       // from at_ on to be taken
  std::size_t at_ = 0;
  std::size_t total_ = 0;  // bytes that were appended in calls before
  Layout layout_ = Layout::unknown;
  bool isAtLineStart_ = true;
  std::uint64_t firstOffset_ = 0;
  std::size_t lineStart_ = 0;  // how many bytes there were before this line
  bool isInBraces_ = false;
  bool isBehindEscape_ = false;
  bool isSkipped_ = false;  // the rest of the line is a dump's column of characters
  bool isDone_ = false;     // the rest stands behind the braces
  char quote_ = '\0';       // of the string that is being read
};

}  // namespace orv::spelling
