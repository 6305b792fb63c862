// decode, encode and convert, which differ in their formats alone.
#include <string>
#include <string_view>

#include <orv/delimited_stream.hpp>
#include <orv/json/renderer.hpp>
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

  // A message that came as bytes is written to bytes as it came, once it was checked. What is malformed is
  // written as bytes, with the error beside it where the format has a place for it.
  Outcome<void> take(const MessageInput& input) override {
    if (isBytes(format_)) return takeEncoding(input);
    const auto message = input.message();
    if (message) return write(input, message->get(), {});
    const Failure& failure = message.error();
    if (failure.extent == Extent::message && !options_.keepsGoing) return std::unexpected(failure);
    const auto closed = input.message(PayloadPairing::closed());
    if (auto written = write(input, closed ? closed->get() : nullptr, failure.reason); !written)
      return written;
    return std::unexpected(failure);
  }

 private:
  Outcome<void> takeEncoding(const MessageInput& input) {
    const auto checked = input.check();
    if (!checked && !options_.keepsGoing) return checked;
    if (auto written = writeEncoding(input); !written) return written;
    return checked;
  }

  Outcome<void> writeEncoding(const MessageInput& input) {
    std::string_view bytes = input.encoding();
    std::string piece;
    if (options_.isDelimited) {
      if (auto appended = appendDelimited(bytes, piece); !appended)
        return fail(ExitStatus::malformed, input.path() + ": " + std::string(describe(appended.error())));
      bytes = piece;
    }
    if (format_ == Format::binary) return output_.write(bytes);
    std::string spelled;
    if (format_ == Format::hex) spelling::appendHex(bytes, spelled);
    if (format_ == Format::base64) spelling::appendBase64(bytes, spelled);
    return output_.write(spelled + '\n');
  }

  // Without a message, the bytes that are none.
  Outcome<void> write(const MessageInput& input, const MessageValue* message, std::string_view error) {
    return output_.write(format_ == Format::json ? json(input, message, error) : text(input, message, error));
  }

  std::string json(const MessageInput& input, const MessageValue* message, std::string_view error) const {
    const bool isIndented = !options_.isDelimited;
    std::string document = "{}";
    if (message != nullptr)
      document = message->json({.isIndented = isIndented,
                                .showsUnknownFields = options_.showsUnknownFields,
                                .hidesSecrets = options_.hidesSecrets});
    const auto addMember = [&](std::string_view name, std::string_view value) {
      document.resize(document.size() - (isIndented && document.size() > 2 ? 2 : 1));
      if (document.size() > 1) document += ',';
      document += isIndented ? "\n  " : "";
      json::appendQuoted(name, document);
      document += isIndented ? ": " : ":";
      json::appendQuoted(value, document);
      document += isIndented ? "\n}" : "}";
    };
    if (!error.empty()) addMember("error", error);
    if (message == nullptr) {
      std::string bytes;
      if (!options_.hidesSecrets) spelling::appendBase64(input.encoding(), bytes);
      addMember("bytes", options_.hidesSecrets ? "<redacted>" : bytes);
    }
    document += '\n';
    return document;
  }

  // What is no field is a comment.
  std::string text(const MessageInput& input, const MessageValue* message, std::string_view error) {
    std::string piece;
    if (options_.isDelimited) {
      if (!isFirst_) piece += '\n';
      piece += textSeparator;
      piece += ' ' + std::to_string(input.frame().number) + ", at " + bytePlace(input.frame().offset) + '\n';
    }
    isFirst_ = false;
    if (!error.empty()) piece.append("# error at ").append(error) += '\n';
    if (message != nullptr) return piece + message->text({.hidesSecrets = options_.hidesSecrets});
    piece += "# bytes ";
    if (options_.hidesSecrets) {
      piece += "<redacted>";
    } else {
      spelling::appendHex(input.encoding(), piece, " ");
    }
    return piece + '\n';
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
