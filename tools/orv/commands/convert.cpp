// decode, encode and convert, which differ in their formats alone.
#include <string>
#include <string_view>

#include <orv/delimited_stream.hpp>
#include <orv/spelling/base64.hpp>
#include <orv/spelling/hex.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/input/text_stream.hpp"

namespace orv::tool {

namespace {

// Writes messages in any format.
class Conversion final : public MessageWork {
 public:
  Conversion(const Options& options, OutputFile& output)
      : options_(options), format_(*options.to), output_(output) {}

  // A message that came as bytes is written to bytes as it came, once it was checked.
  Outcome<void> take(const MessageInput& input) override {
    if (isBytes(format_)) return writeEncoding(input);
    const auto message = input.message();
    if (!message) return std::unexpected(message.error());
    return output_.write(format_ == Format::json ? json(**message) : text(input, **message));
  }

 private:
  Outcome<void> writeEncoding(const MessageInput& input) {
    if (auto checked = input.check(); !checked) return checked;
    std::string_view bytes = input.encoding();
    std::string piece;
    if (options_.isDelimited) {
      appendDelimited(bytes, piece);
      bytes = piece;
    }
    if (format_ == Format::binary) return output_.write(bytes);
    std::string spelled;
    if (format_ == Format::hex) spelling::appendHex(bytes, spelled);
    if (format_ == Format::base64) spelling::appendBase64(bytes, spelled);
    return output_.write(spelled + '\n');
  }

  std::string json(const MessageValue& message) const {
    return message.json(
               {.isIndented = !options_.isDelimited, .showsUnknownFields = options_.showsUnknownFields}) +
           '\n';
  }

  std::string text(const MessageInput& input, const MessageValue& message) {
    std::string piece;
    if (options_.isDelimited) {
      if (!isFirst_) piece += '\n';
      piece += textSeparator;
      piece += ' ' + std::to_string(input.frame().number) + ", at " + bytePlace(input.frame().offset) + '\n';
    }
    isFirst_ = false;
    return piece + message.text();
  }

  const Options& options_;
  Format format_;
  OutputFile& output_;
  bool isFirst_ = true;
};

}  // namespace

ExitStatus runConvert(const Options& options) {
  OutputFile output(options.output);
  Conversion conversion(options, output);
  return forEachMessage(options, output, conversion);
}

}  // namespace orv::tool
