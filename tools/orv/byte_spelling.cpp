#include "tools/orv/byte_spelling.hpp"

#include <orv/json/base64.hpp>

namespace orv::tool {

namespace {

bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

std::string shown(char c) {
  const auto byte = static_cast<unsigned char>(c);
  if (byte >= 0x20 && byte < 0x7F) return std::string("\"") + c + "\"";
  return std::string("byte 0x") + "0123456789abcdef"[byte >> 4] + "0123456789abcdef"[byte & 0xF];
}

}  // namespace

void TextPosition::advance(char character) {
  if (character == '\n') {
    ++line_;
    column_ = 1;
  } else if ((static_cast<unsigned char>(character) & 0xC0) != 0x80) {
    ++column_;
  }
}

std::expected<void, SpellingFault> HexReader::take(std::string_view piece, std::string& bytes) {
  for (const char character : piece) {
    const int digit = digitValue(character);
    if (digit >= 0 && half_ < 0) {
      half_ = digit;
      mayBePrefix_ = isAtStart_ && digit == 0;
      isAtStart_ = false;
    } else if (digit >= 0) {
      bytes += static_cast<char>(half_ << 4 | digit);
      half_ = -1;
    } else if ((character == 'x' || character == 'X') && half_ == 0 && mayBePrefix_) {
      half_ = -1;
    } else if (isSpace(character) && half_ < 0) {
      isAtStart_ = true;
    } else {
      return failAt(character);
    }
    position_.advance(character);
  }
  return {};
}

std::unexpected<SpellingFault> HexReader::failAt(char character) const {
  std::string reason = isSpace(character) ? "half a byte: an odd number of hexadecimal digits"
                                          : shown(character) + " is no hexadecimal digit";
  return std::unexpected(SpellingFault{std::move(reason), position_.line(), position_.column()});
}

std::expected<void, SpellingFault> HexReader::finish() const {
  if (half_ < 0) return {};
  return failAt(' ');
}

std::expected<void, SpellingFault> Base64Reader::take(std::string_view piece, std::string& bytes) {
  for (const char character : piece) {
    if (!isSpace(character)) {
      if (group_.empty()) groupStart_ = position_;
      group_ += character;
    }
    if (group_.size() == 4) {
      const auto decoded = json::decodeBase64(group_);
      if (!decoded) return failInGroup();
      bytes += *decoded;
      group_.clear();
    }
    position_.advance(character);
  }
  return {};
}

std::expected<void, SpellingFault> Base64Reader::finish(std::string& bytes) const {
  const auto decoded = json::decodeBase64(group_);
  if (!decoded) return failInGroup();
  bytes += *decoded;
  return {};
}

std::unexpected<SpellingFault> Base64Reader::failInGroup() const {
  return std::unexpected(SpellingFault{"no base64 digits", groupStart_.line(), groupStart_.column()});
}

}  // namespace orv::tool
