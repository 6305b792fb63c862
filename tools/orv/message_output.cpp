#include "tools/orv/message_output.hpp"

#include <utility>

#include <orv/delimited_stream.hpp>
#include <orv/json/base64.hpp>
#include "tools/orv/text_stream.hpp"
#include "tools/orv/value_text.hpp"

namespace orv::tool {

namespace {

std::string spelled(Format format, std::string_view bytes) {
  std::string line;
  if (format == Format::base64) {
    json::appendBase64(bytes, line);
  } else {
    line.reserve(2 * bytes.size() + 1);
    for (const char c : bytes) {
      const auto byte = static_cast<unsigned char>(c);
      line += "0123456789abcdef"[byte >> 4];
      line += "0123456789abcdef"[byte & 0xF];
    }
  }
  return line += '\n';
}

}  // namespace

MessageOutput::MessageOutput(OutputFile& file, Format format, const Options& options)
    : file_(file), format_(format), options_(options) {}

Outcome<void> MessageOutput::write(const MessageInput& input) {
  if (isBytes(format_)) return writeEncoding(input);
  auto message = input.message();
  if (!message) return std::unexpected(std::move(message.error()));
  piece_.clear();
  if (format_ == Format::json) {
    piece_ = (*message)->json(
        {.isIndented = !options_.isDelimited, .showsUnknownFields = options_.showsUnknownFields});
    piece_ += '\n';
  } else {
    appendText(input, **message);
  }
  isFirst_ = false;
  return file_.write(piece_);
}

Outcome<void> MessageOutput::writeEncoding(const MessageInput& input) {
  if (auto checked = input.check(); !checked) return checked;
  std::string_view bytes = input.encoding();
  if (options_.isDelimited) {
    piece_.clear();
    appendDelimited(bytes, piece_);
    bytes = piece_;
  }
  return file_.write(format_ == Format::binary ? bytes : spelled(format_, bytes));
}

void MessageOutput::appendText(const MessageInput& input, const MessageValue& message) {
  if (options_.isDelimited) {
    if (!isFirst_) piece_ += '\n';
    piece_ += textSeparator;
    piece_ += ' ' + std::to_string(input.frame().number) + ", at " + bytePlace(input.frame().offset) + '\n';
  }
  piece_ += message.text();
}

}  // namespace orv::tool
