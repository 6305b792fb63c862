// Bytes as text of 64 characters (RFC 4648).
#pragma once

#include <expected>
#include <optional>
#include <string>
#include <string_view>

#include <orv/spelling/text_position.hpp>

namespace orv::inline v0::spelling {

// Appends the standard alphabet's form, padded.
void appendBase64(std::string_view bytes, std::string& output);

// Takes both alphabets, with or without padding; nothing else, white space included. None for what is no
// base64.
std::optional<std::string> decodeBase64(std::string_view text);

// Reads base64 with white space in it, piece by piece; padded runs may follow one another.
class Base64Reader {
 public:
  // Appends the bytes that the piece completes.
  std::expected<void, TextError> take(std::string_view piece, std::string& bytes);
  // There is no more: appends what is left.
  std::expected<void, TextError> finish(std::string& bytes);

 private:
  TextPosition position_;
  TextPosition groupStart_;
  std::string group_;  // up to four digits
};

}  // namespace orv::spelling
