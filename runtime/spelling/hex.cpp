#include <orv/spelling/hex.hpp>

#include <algorithm>
#include <charconv>
#include <optional>
#include <utility>

#include <orv/spelling/escape.hpp>

namespace orv::inline v0::spelling {

namespace {

// Stands between bytes and means nothing.
bool isSeparator(char c) { return isSpace(c) || c == ',' || c == ':' || c == ';' || c == '-'; }

std::size_t countDigits(std::string_view text) {
  const auto isNoDigit = [](char c) { return digitValue(c) < 0; };
  return static_cast<std::size_t>(std::ranges::find_if(text, isNoDigit) - text.begin());
}

std::size_t countBlanks(std::string_view text) {
  return std::min(text.find_first_not_of(" \t"), text.size());
}

bool hasHexPrefix(std::string_view text) { return text.starts_with("0x") || text.starts_with("0X"); }

// The offset that a line of a dump begins with.
struct Offset {
  std::string_view digits;
  std::size_t end = 0;  // of it in the line, with its colon

  bool isNumber(std::uint64_t number) const { return is(number, 16) || is(number, 8); }
  bool is(std::uint64_t number, int base) const {
    std::uint64_t value = 0;
    const auto [stop, status] = std::from_chars(digits.data(), digits.data() + digits.size(), value, base);
    return status == std::errc() && stop == digits.data() + digits.size() && value == number;
  }
};

// None unless there are digits enough, and a blank or the line's end behind.
std::optional<Offset> offsetOf(std::string_view line, bool hasColon) {
  constexpr std::size_t leastDigits = 4;
  std::size_t at = countBlanks(line);
  if (hasHexPrefix(line.substr(at))) at += 2;
  const std::string_view digits = line.substr(at, countDigits(line.substr(at)));
  at += digits.size();
  if (hasColon && line.substr(at).starts_with(':')) {
    ++at;
  } else if (hasColon) {
    return std::nullopt;
  }
  const bool isEnded = at == line.size() || isSpace(line[at]);
  if (digits.size() < leastDigits || !isEnded) return std::nullopt;
  return Offset{digits, at};
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
  constexpr std::size_t longLine = 4096;
  constexpr std::size_t longestPiece = 64;
  text_ += piece;
  if (const auto lineEnd = text_.rfind('\n'); lineEnd != std::string::npos) {
    if (auto taken = takeUpTo(lineEnd + 1, bytes); !taken) return taken;
  }
  if (text_.size() < longLine) return {};
  return takeUpTo(text_.size() - longestPiece, bytes);
}

std::expected<void, TextError> HexReader::finish(std::string& bytes) {
  if (auto taken = takeUpTo(text_.size(), bytes); !taken) return taken;
  if (quote_ != '\0') return failAt(at_, "a string without its closing quotation mark");
  return {};
}

HexReader::Taken HexReader::takeUpTo(std::size_t end, std::string& bytes) {
  const std::size_t before = bytes.size();
  const auto count = [&] { return total_ + bytes.size() - before; };
  while (at_ < end) {
    const char c = text_[at_];
    Taken taken;
    if (isDone_ || (isSkipped_ && c != '\n')) {  // NOLINT(bugprone-branch-clone): asked in this order
      ++at_;
    } else if (std::exchange(isAtLineStart_, false)) {
      lineStart_ = count();
      taken = takeLineStart();
    } else if (quote_ != '\0') {
      taken = takeInString(bytes);
    } else if (c == '"' || c == '\'') {
      quote_ = c;
      ++at_;
    } else if (c == '\\') {
      taken = takeEscapeOf(bytes);
      isBehindEscape_ = true;
    } else if (c == 'b' && (text_[at_ + 1] == '"' || text_[at_ + 1] == '\'')) {
      ++at_;
    } else if (isInBraces_ && c == '}') {
      isDone_ = true;
    } else if (isSeparator(c) || (isInBraces_ && c == '{')) {
      isBehindEscape_ = false;
      isAtLineStart_ = c == '\n';
      const std::size_t blanks = countBlanks(std::string_view(text_).substr(at_));
      // xxd has two blanks before its characters, what has no colon three, and two in the middle.
      const bool isWide =
          (layout_ == Layout::colon && blanks > 1) || (layout_ == Layout::blank && blanks > 2);
      isSkipped_ = isWide && count() != lineStart_;
      at_ += std::max<std::size_t>(blanks, 1);
    } else if (layout_ == Layout::blank && (c == '|' || c == '>')) {
      isSkipped_ = true;
    } else {
      taken = takeDigits(bytes);
    }
    if (!taken) return taken;
  }
  for (const char c : std::string_view(text_).substr(0, at_)) position_.advance(c);
  total_ = count();
  text_.erase(0, at_);
  at_ = 0;
  return {};
}

HexReader::Taken HexReader::takeLineStart() {
  const std::string_view line = std::string_view(text_).substr(at_, text_.find('\n', at_) - at_);
  if (std::ranges::all_of(line, isSpace)) return {};
  if (layout_ == Layout::unknown) {
    const auto brace = line.find('{');
    const std::string_view declaration = line.substr(0, std::min(brace, line.size()));
    const bool isDeclared = std::ranges::all_of(declaration, isSpace) || declaration.ends_with("= ") ||
                            declaration.ends_with('=');
    isInBraces_ = brace != std::string_view::npos && isDeclared;
    const auto withColon = offsetOf(line, /*hasColon=*/true);
    const auto withBlank = offsetOf(line, /*hasColon=*/false);
    layout_ = withColon                             ? Layout::colon
              : withBlank && withBlank->isNumber(0) ? Layout::blank
                                                    : Layout::withoutOffsets;
    if (withColon)
      (void)std::from_chars(withColon->digits.data(), withColon->digits.data() + withColon->digits.size(),
                            firstOffset_, 16);
    if (isInBraces_) at_ += brace + 1;
  }
  if (layout_ == Layout::withoutOffsets) return {};
  if (line.starts_with('*')) return failAt(at_, "the dump leaves lines out");
  const auto offset = offsetOf(line, layout_ == Layout::colon);
  if (!offset) return failAt(at_, "the line has no offset");
  const std::uint64_t expected = firstOffset_ + lineStart_;
  if (!offset->isNumber(expected))
    return failAt(at_, "not the offset of the next byte, 0x" + hexNumber(expected, 4));
  at_ += offset->end;
  return {};
}

HexReader::Taken HexReader::takeInString(std::string& bytes) {
  const char c = text_[at_];
  if (c == '\\') return takeEscapeOf(bytes);
  if (c == '\n') return failAt(at_, "a string without its closing quotation mark");
  if (c == quote_)
    quote_ = '\0';
  else
    bytes += c;
  ++at_;
  return {};
}

HexReader::Taken HexReader::takeEscapeOf(std::string& bytes) {
  const std::size_t length = takeEscape(std::string_view(text_).substr(at_), bytes);
  if (length == 0) return failAt(at_, "an escape that C does not have");
  at_ += length;
  return {};
}

// A pair, or behind 0x a single one.
HexReader::Taken HexReader::takeDigits(std::string& bytes) {
  if (isBehindEscape_) return failAt(at_, "characters between escapes need quotation marks");
  const bool hasPrefix = hasHexPrefix(std::string_view(text_).substr(at_));
  if (hasPrefix) at_ += 2;
  const std::size_t count = countDigits(std::string_view(text_).substr(at_, 3));
  if (layout_ == Layout::blank && count > 2) return failAt(at_, "bytes in groups, whose order is not known");
  if (count == 0) return failAt(at_, shown(text_[at_]) + " is no hexadecimal digit");
  if (count == 1 && !hasPrefix) {
    const std::size_t next = at_ + 1;
    const bool isHalf = next == text_.size() || isSeparator(text_[next]);
    return failAt(next, isHalf ? "half a byte: an odd number of hexadecimal digits"
                               : shown(text_[next]) + " is no hexadecimal digit");
  }
  int byte = 0;
  for (std::size_t taken = 0; taken < std::min<std::size_t>(count, 2); ++taken)
    byte = byte << 4 | digitValue(text_[at_++]);
  bytes += static_cast<char>(byte);
  return {};
}

std::unexpected<TextError> HexReader::failAt(std::size_t at, std::string reason) const {
  TextPosition place = position_;
  for (const char c : std::string_view(text_).substr(0, at)) place.advance(c);
  return std::unexpected(place.error(std::move(reason)));
}

}  // namespace orv::spelling
