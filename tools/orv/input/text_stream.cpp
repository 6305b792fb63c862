#include "tools/orv/input/text_stream.hpp"

#include <algorithm>
#include <utility>

#include <orv/byte_view.hpp>

namespace orv::tool {

namespace {

bool isBlank(std::string_view line) { return line.find_first_not_of(" \t\r\n") == std::string_view::npos; }

bool isBlankOrComment(std::string_view line) {
  return isBlank(line) || line[line.find_first_not_of(" \t")] == '#';
}

// Follows the brackets of a JSON document, outside its strings.
class BracketDepth {
 public:
  void take(std::string_view line) {
    // A string ends in its line, also where its closing quote is missing.
    bool isInString = false;
    for (std::size_t at = 0; at < line.size(); ++at) {
      const char c = line[at];
      if (isInString && c == '\\')
        ++at;
      else if (c == '"')
        isInString = !isInString;
      else if (!isInString && (c == '{' || c == '['))
        ++depth_;
      else if (!isInString && (c == '}' || c == ']'))
        --depth_;
    }
  }
  bool isClosed() const { return depth_ <= 0; }

 private:
  std::int64_t depth_ = 0;
};

}  // namespace

Outcome<std::optional<Frame>> TextStream::next() {
  ++frame_.number;
  startAtNextLine();
  const auto gathered = isJson_ ? gatherDocument() : gatherText();
  if (!gathered) return std::unexpected(gathered.error());
  if (!*gathered) return std::nullopt;
  frame_.content = text_;
  return frame_;
}

void TextStream::startAtNextLine() {
  text_.clear();
  frame_.offset = nextOffset_;
  frame_.line = nextLine_;
}

Outcome<void> TextStream::add(std::string_view line) {
  if (line.size() > maximumSize() - text_.size()) return failTooLarge(frame_);
  text_ += line;
  return {};
}

Outcome<bool> TextStream::readLine(std::string& line) {
  std::size_t searched = taken_;
  for (;;) {
    const auto end = buffer_.find('\n', searched);
    if (end != std::string::npos) {
      line.assign(buffer_, taken_, end + 1 - taken_);
      break;
    }
    searched = buffer_.size() - taken_;
    buffer_.erase(0, taken_);
    taken_ = 0;
    if (buffer_.size() > maximumSize()) return failTooLarge(frame_);
    std::byte piece[65536];
    const std::ptrdiff_t count = file_.read(piece);
    if (count < 0) return std::unexpected(file_.failure());
    if (count == 0) {
      line = buffer_;
      break;
    }
    buffer_ += charactersOf(std::span(piece).first(static_cast<std::size_t>(count)));
  }
  taken_ += line.size();
  nextOffset_ += line.size();
  nextLine_ += line.empty() ? 0 : 1;
  return !line.empty();
}

Outcome<bool> TextStream::gatherDocument() {
  BracketDepth depth;
  for (std::string line;;) {
    const auto isRead = readLine(line);
    if (!isRead) return isRead;
    if (!*isRead) return !text_.empty();
    if (text_.empty() && isBlank(line)) {
      startAtNextLine();
      continue;
    }
    if (const auto added = add(line); !added) return std::unexpected(added.error());
    depth.take(line);
    if (depth.isClosed()) return true;
  }
}

Outcome<bool> TextStream::gatherText() {
  bool isFound = std::exchange(isBehindSeparator_, false);
  for (std::string line;;) {
    const auto isRead = readLine(line);
    if (!isRead) return isRead;
    if (!*isRead) return isFound;
    if (line.starts_with(textSeparator)) {
      isBehindSeparator_ = isFound;
      if (isFound) return true;
      isFound = true;
      startAtNextLine();
      continue;
    }
    // Before the first separator a message needs something to be seen.
    isFound = isFound || !isBlankOrComment(line);
    if (const auto added = add(line); !added) return std::unexpected(added.error());
  }
}

}  // namespace orv::tool
