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

// Reads base64 with white space in it, piece by piece.
class Base64Reader {
 public:
  // Padding ends a run. What follows it is an error, or another run.
  enum class Runs : bool { one, several };

  explicit Base64Reader(Runs runs = Runs::one) : runs_(runs) {}

  // Appends the bytes that the piece completes.
  std::expected<void, TextError> take(std::string_view piece, std::string& bytes);
  // There is no more: appends what is left.
  std::expected<void, TextError> finish(std::string& bytes);

 private:
  TextPosition position_;
  TextPosition groupStart_;
  std::string group_;  // up to four digits
  Runs runs_;
  bool isPadded_ = false;  // nothing may follow
};

}  // namespace orv::spelling
