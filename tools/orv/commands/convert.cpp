// decode, encode and convert, which differ in their formats alone.
#include <string>
#include <string_view>

#include <orv/byte_view.hpp>
#include <orv/delimited_stream.hpp>
#include <orv/json/renderer.hpp>
#include <orv/spelling/base64.hpp>
#include <orv/spelling/hex.hpp>
#include "tools/orv/command_line/command.hpp"
#include "tools/orv/input/message_input.hpp"
#include "tools/orv/input/text_stream.hpp"
#include "tools/orv/messages/salvage.hpp"

namespace orv::tool {

namespace {

// With another line's end, and what follows it, in place of each.
void appendLines(std::string_view text, std::string_view lineEnd, std::string& output) {
  for (const char c : text) output += c == '\n' ? lineEnd : std::string_view(&c, 1);
}

// Writes messages in any format.
class Conversion final : public MessageWork {
 public:
  Conversion(const Options& options, OutputFile& output)
      : options_(options), format_(*options.to), output_(output) {}

  // A message that came as bytes is written to bytes as it came, once it was checked. What is malformed is
  // written as bytes, with the error and what stands before it beside them where the format has a place for that.
  Outcome<void> take(const MessageInput& input) override {
    if (isBytes(format_)) return takeEncoding(input);
    const auto message = input.message();
    if (message) return write(input, {.message = message->get()});
    const Failure& failure = message.error();
    const auto salvaged = salvage(*options_.type, bytesOf(input.encoding()), options_.payloads,
                                  options_.hidesSecrets ? CutFields::leaveOut : CutFields::take);
    if (failure.extent == Extent::message && !options_.keepsGoing && (options_.isDelimited || !salvaged))
      return std::unexpected(failure);
    const auto closed = input.message(PayloadPairing::closed());
    if (auto written = write(input, {.message = closed ? closed->get() : nullptr,
                                     .error = failure.reason,
                                     .salvaged = salvaged ? &*salvaged : nullptr});
        !written)
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

  struct Shown {
    const MessageValue* message;  // none where the bytes are none
    std::string_view error{};
    const Salvage* salvaged = nullptr;
  };

  Outcome<void> write(const MessageInput& input, const Shown& shown) {
    return output_.write(format_ == Format::json ? json(input, shown) : text(input, shown));
  }

  std::string json(const MessageInput& input, const Shown& shown) const {
    const json::RenderOptions style{.isIndented = !options_.isDelimited,
                                    .showsUnknownFields = options_.showsUnknownFields,
                                    .hidesSecrets = options_.hidesSecrets};
    std::string document = shown.message != nullptr ? shown.message->json(style) : "{}";
    if (shown.error.empty()) return document + '\n';
    document.resize(document.size() - (style.isIndented && document.size() > 2 ? 2 : 1));
    const auto startMember = [&](std::string_view name) {
      if (document.size() > 1) document += ',';
      document.append(style.isIndented ? "\n  \"" : "\"")
          .append(name)
          .append(style.isIndented ? "\": " : "\":");
    };
    const auto addText = [&](std::string_view name, std::string_view text) {
      startMember(name);
      json::appendQuoted(text, document);
    };
    addText("error", shown.error);
    if (shown.message == nullptr) {
      std::string bytes;
      if (!options_.hidesSecrets) spelling::appendBase64(input.encoding(), bytes);
      addText("bytes", options_.hidesSecrets ? "<redacted>" : bytes);
    }
    if (shown.salvaged != nullptr) {
      startMember("partial");
      // Line ends stand between values only.
      appendLines(shown.salvaged->message->json(style), "\n  ", document);
      if (!shown.salvaged->cut.empty()) addText("truncated", shown.salvaged->cut);
    }
    return document + (style.isIndented ? "\n}\n" : "}\n");
  }

  // What is no field of a message is a comment, and so are those that are not all.
  std::string text(const MessageInput& input, const Shown& shown) {
    const TextStyle style{.hidesSecrets = options_.hidesSecrets};
    std::string piece;
    if (options_.isDelimited) {
      if (!isFirst_) piece += '\n';
      piece += textSeparator;
      piece += ' ' + std::to_string(input.frame().number) + ", at " + bytePlace(input.frame().offset) + '\n';
    }
    isFirst_ = false;
    if (!shown.error.empty()) piece.append("# error at ").append(shown.error) += '\n';
    if (shown.message != nullptr) {
      piece += shown.message->text(style);
    } else {
      piece += "# bytes ";
      if (options_.hidesSecrets) piece += "<redacted>";
      if (!options_.hidesSecrets) spelling::appendHex(input.encoding(), piece, " ");
      piece += '\n';
    }
    if (shown.salvaged == nullptr) return piece;
    piece += "# partial, read before the error";
    if (!shown.salvaged->cut.empty()) piece += "; truncated: " + shown.salvaged->cut;
    appendLines("\n" + shown.salvaged->message->text(style), "\n#   ", piece);
    piece.resize(piece.rfind('\n') + 1);
    return piece;
  }

  const Options& options_;
  Format format_;
  OutputFile& output_;
  bool isFirst_ = true;
};

}  // namespace

ExitStatus runConvert(const Options& options) { return forEachMessage<Conversion>(options); }

}  // namespace orv::tool
