#include <orv/spelling/base64.hpp>

#include <array>
#include <cstddef>
#include <cstdint>

namespace orv::inline v0::spelling {

namespace {

constexpr std::string_view alphabet = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::uint8_t noDigit = 64;

constexpr auto digitValues = [] {
  std::array<std::uint8_t, 256> table{};
  table.fill(noDigit);
  for (std::size_t value = 0; value < alphabet.size(); ++value)
    table[static_cast<unsigned char>(alphabet[value])] = static_cast<std::uint8_t>(value);
  table['-'] = table['+'];
  table['_'] = table['/'];
  return table;
}();

}  // namespace

void appendBase64(std::string_view bytes, std::string& output) {
  output.reserve(output.size() + (bytes.size() + 2) / 3 * 4);
  for (std::size_t at = 0; at < bytes.size(); at += 3) {
    const std::string_view group = bytes.substr(at, 3);
    std::uint32_t bits = 0;
    for (std::size_t index = 0; index < 3; ++index) {
      bits = bits << 8 | (index < group.size() ? static_cast<unsigned char>(group[index]) : 0U);
    }
    for (std::size_t index = 0; index < 4; ++index) {
      output += index <= group.size() ? alphabet[bits >> (18 - 6 * index) & 63] : '=';
    }
  }
}

std::optional<std::string> decodeBase64(std::string_view text) {
  if (text.ends_with('=')) {
    if (text.size() % 4 != 0) return std::nullopt;
    text.remove_suffix(text.ends_with("==") ? 2 : 1);
  }
  // One digit alone holds no byte.
  if (text.size() % 4 == 1) return std::nullopt;
  std::string bytes;
  bytes.reserve(text.size() / 4 * 3 + 2);
  std::uint32_t bits = 0;
  int bitCount = 0;
  for (const char character : text) {
    const std::uint8_t digit = digitValues[static_cast<unsigned char>(character)];
    if (digit == noDigit) return std::nullopt;
    bits = bits << 6 | digit;
    bitCount += 6;
    if (bitCount < 8) continue;
    bitCount -= 8;
    bytes += static_cast<char>(bits >> bitCount & 0xFF);
  }
  return bytes;
}

std::expected<void, TextError> Base64Reader::take(std::string_view piece, std::string& bytes) {
  for (const char character : piece) {
    if (!isSpace(character)) {
      if (isPadded_) return std::unexpected(position_.error("more behind the padding, which ends a message"));
      if (group_.empty()) groupStart_ = position_;
      group_ += character;
    }
    if (group_.size() == 4) {
      if (auto taken = finish(bytes); !taken) return taken;
    }
    position_.advance(character);
  }
  return {};
}

std::expected<void, TextError> Base64Reader::finish(std::string& bytes) {
  const auto decoded = decodeBase64(group_);
  if (!decoded) return std::unexpected(groupStart_.error("no base64 digits"));
  bytes += *decoded;
  isPadded_ = runs_ == Runs::one && group_.ends_with('=');
  group_.clear();
  return {};
}

}  // namespace orv::spelling
