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

TextStream::Step TextStream::next() { return isJson_ ? nextDocument() : nextText(); }

void TextStream::startAtNextLine() {
  text_.clear();
  offset_ = nextOffset_;
  line_ = nextLine_;
}

TextStream::Step TextStream::readLine(std::string& line) {
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
    if (buffer_.size() > maximumSize_) return Step::tooLarge;
    std::byte piece[65536];
    const std::ptrdiff_t count = file_.read(piece);
    if (count < 0) return Step::readFailed;
    if (count == 0) {
      line = buffer_;
      break;
    }
    buffer_.append(charactersOf(std::span(piece).first(static_cast<std::size_t>(count))));
  }
  taken_ += line.size();
  nextOffset_ += line.size();
  nextLine_ += line.empty() ? 0 : 1;
  return line.empty() ? Step::end : Step::text;
}

TextStream::Step TextStream::nextDocument() {
  BracketDepth depth;
  startAtNextLine();
  for (std::string line;;) {
    const Step step = readLine(line);
    if (step == Step::end && !text_.empty()) return Step::text;
    if (step != Step::text) return step;
    if (text_.empty() && isBlank(line)) {
      startAtNextLine();
      continue;
    }
    if (line.size() > maximumSize_ - text_.size()) return Step::tooLarge;
    text_ += line;
    depth.take(line);
    if (depth.isClosed()) return Step::text;
  }
}

TextStream::Step TextStream::nextText() {
  bool isFound = std::exchange(isBehindSeparator_, false);
  startAtNextLine();
  for (std::string line;;) {
    const Step step = readLine(line);
    if (step == Step::end && isFound) return Step::text;
    if (step != Step::text) return step;
    if (line.starts_with(textSeparator)) {
      if (isFound) {
        isBehindSeparator_ = true;
        return Step::text;
      }
      isFound = true;
      startAtNextLine();
      continue;
    }
    // Before the first separator a message needs something to be seen.
    isFound = isFound || !isBlankOrComment(line);
    if (line.size() > maximumSize_ - text_.size()) return Step::tooLarge;
    text_ += line;
  }
}

}  // namespace orv::tool
