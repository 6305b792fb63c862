#include <orv/spelling/hex.hpp>

#include <algorithm>

namespace orv::inline v0::spelling {

namespace {

int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

std::string shown(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return byte >= 0x20 && byte < 0x7F ? std::string("\"") + c + "\"" : "byte 0x" + hexNumber(byte, 2);
}

}  // namespace

void appendHex(std::string_view bytes, std::string& output, std::string_view between) {
  if (bytes.empty()) return;
  const std::size_t start = output.size();
  output.resize(start + bytes.size() * (2 + between.size()) - between.size());
  char* target = output.data() + start;
  for (std::size_t at = 0; at < bytes.size(); ++at) {
    if (at != 0) target = std::ranges::copy(between, target).out;
    const auto byte = static_cast<unsigned char>(bytes[at]);
    *target++ = internal::hexDigits[byte >> 4];
    *target++ = internal::hexDigits[byte & 0xF];
  }
}

std::expected<void, TextError> HexReader::take(std::string_view piece, std::string& bytes) {
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

std::unexpected<TextError> HexReader::failAt(char character) const {
  return std::unexpected(position_.error(isSpace(character)
                                             ? "half a byte: an odd number of hexadecimal digits"
                                             : shown(character) + " is no hexadecimal digit"));
}

std::expected<void, TextError> HexReader::finish(std::string&) {
  if (half_ < 0) return {};
  return failAt(' ');
}

}  // namespace orv::spelling
