#include "tools/orv/input/text_stream.hpp"

#include <algorithm>

#include <orv/byte_view.hpp>

namespace orv::tool {

namespace {

// Whether there is nothing to be seen but comments.
bool isBlank(std::string_view text) {
  for (std::size_t at = 0; at < text.size(); ++at) {
    if (text[at] == '#')
      at = std::min(text.find('\n', at), text.size());
    else if (!spelling::isSpace(text[at]))
      return false;
  }
  return true;
}

}  // namespace

Outcome<std::optional<Frame>> TextStream::next() {
  drop(frame_.content.size());
  frame_.content = {};
  ++frame_.number;
  for (;;) {
    if (isJson_ && searched_ == 0) drop(std::min(rest().find_first_not_of(" \t\r\n"), rest().size()));
    const auto end = findEnd();
    const std::size_t size = end.value_or(rest().size());
    if (size > maximumSize()) return failTooLarge(frame_);
    if (!end && !isAtEnd_) {
      if (const auto isRead = readMore(); !isRead) return std::unexpected(isRead.error());
      continue;
    }
    const std::string_view content = rest().substr(0, size);
    // Before the first separator a message needs something to be seen.
    if (content.empty() || (!isJson_ && isBlank(content) && !content.starts_with(textSeparator))) {
      drop(size);
      if (!end) return std::nullopt;
      continue;
    }
    frame_.content = content;
    return frame_;
  }
}

std::optional<std::size_t> TextStream::findEnd() {
  if (isJson_) return findEndOfDocument();
  const std::string_view text = rest();
  for (;;) {
    const auto lineEnd = text.find('\n', searched_);
    const bool isWhole = isAtEnd_ || text.size() - lineEnd > textSeparator.size();
    if (lineEnd == std::string_view::npos || !isWhole) {
      searched_ = std::min(lineEnd, text.size());
      return std::nullopt;
    }
    searched_ = lineEnd + 1;
    if (text.substr(searched_).starts_with(textSeparator)) return searched_;
  }
}

std::optional<std::size_t> TextStream::findEndOfDocument() {
  const std::string_view text = rest();
  for (; searched_ < text.size(); ++searched_) {
    const char c = text[searched_];
    if (isInString_) {
      // A string ends in its line, also where its closing quote is missing.
      if (c == '\n' || (c == '"' && !isEscaped_)) isInString_ = false;
      isEscaped_ = c == '\\' && !isEscaped_;
      continue;
    }
    switch (c) {
      case '"': isInString_ = true; break;
      case '{':
      case '[': ++depth_; break;
      case '}':
      case ']':
        if (depth_ <= 1) return searched_ + 1;
        --depth_;
        break;
      case '\n':
        // What is no object or list is a line.
        if (depth_ == 0) return searched_ + 1;
        break;
      default: break;
    }
  }
  return std::nullopt;
}

Outcome<bool> TextStream::readMore() {
  constexpr std::size_t pieceSize = 65536;
  buffer_.erase(0, taken_);
  taken_ = 0;
  const std::size_t before = buffer_.size();
  buffer_.resize(before + pieceSize);
  const std::ptrdiff_t count = file_.read(std::as_writable_bytes(std::span(buffer_).subspan(before)));
  buffer_.resize(before + static_cast<std::size_t>(std::max<std::ptrdiff_t>(count, 0)));
  if (count < 0) return std::unexpected(file_.failure());
  isAtEnd_ = count == 0;
  return !isAtEnd_;
}

void TextStream::drop(std::size_t size) {
  spelling::TextPosition place(frame_.line, frame_.column);
  for (const char c : rest().substr(0, size)) place.advance(c);
  frame_.line = place.line();
  frame_.column = place.column();
  frame_.offset += size;
  taken_ += size;
  searched_ = 0;
  depth_ = 0;
  isInString_ = isEscaped_ = false;
}

}  // namespace orv::tool
