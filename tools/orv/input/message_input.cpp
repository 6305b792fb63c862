#include "tools/orv/input/message_input.hpp"

#include <utility>

#include <orv/byte_view.hpp>
#include <orv/json/document.hpp>
#include "tools/orv/messages/text_form.hpp"
#include "tools/orv/output/progress.hpp"

namespace orv::tool {

namespace {

// An array is no message, but more likely meant for JSON than for an extension in the text format.
Format guessFormat(InputFile& file) {
  const auto first = file.firstVisibleCharacter();
  return first == '{' || first == '[' ? Format::json : Format::text;
}

Outcome<void> takeMessages(const std::string& path, const Options& options, OutputFile& output,
                           MessageWork& work, Progress& progress) {
  const auto opened = MessageInput::open(path, options, output);
  if (!opened) return std::unexpected(opened.error());
  MessageInput& input = **opened;
  for (;;) {
    const auto hasNext = input.next();
    if (!hasNext) {
      if (auto taken = work.takeEnd(hasNext.error()); !taken) return taken;
      return std::unexpected(hasNext.error());
    }
    if (!*hasNext) return {};
    if (auto taken = work.take(input); !taken) return taken;
    progress.update(input.frame().number, input.frame().offset);
  }
}

}  // namespace

MessageInput::MessageInput(InputFile file, const std::string& path, const Options& options)
    : file_(std::move(file)),
      path_(path),
      options_(options),
      format_(options.from ? *options.from : guessFormat(file_)),
      reader_(FrameReader::make(file_, format_, options)) {}

Outcome<std::unique_ptr<MessageInput>> MessageInput::open(const std::string& path, const Options& options,
                                                          OutputFile& output) {
  auto file = InputFile::open(path, output);
  if (!file) return std::unexpected(std::move(file.error()));
  return std::unique_ptr<MessageInput>(new MessageInput(std::move(*file), path, options));
}

Outcome<bool> MessageInput::next() {
  const auto frame = reader_->next();
  if (!frame) return std::unexpected(frame.error());
  if (!frame->has_value()) return false;
  frame_ = **frame;
  encoding_ = frame_.content;
  if (isBytes(format_)) return true;
  auto encoded = format_ == Format::json ? encodeJson() : encodeText();
  if (!encoded) return std::unexpected(std::move(encoded.error()));
  encoded_ = std::move(*encoded);
  encoding_ = encoded_;
  return true;
}

Outcome<std::string> MessageInput::encodeText() const {
  auto encoded = encodeTextForm(*options_.type, frame_.content, options_.payloads);
  if (!encoded) return std::unexpected(reader_->malformedText(frame_, encoded.error()));
  return std::move(*encoded);
}

Outcome<std::string> MessageInput::encodeJson() const {
  const auto failure = [&](const json::Error& error) {
    if (!error.path.empty()) return std::unexpected(reader_->malformed(frame_, error.message()));
    return std::unexpected(reader_->malformedText(frame_, {error.reason, error.line, error.column}));
  };
  const auto document = json::Document::parse(frame_.content);
  if (!document) return failure(document.error());
  const auto message = readJsonMessage(*options_.type, document->root(), options_.payloads);
  if (!message) return failure(message.error());
  auto encoded = (*message)->serialize();
  if (!encoded) return std::unexpected(reader_->malformed(frame_, describe(encoded.error())));
  return std::move(*encoded);
}

Outcome<void> MessageInput::check() const {
  if (!isBytes(format_)) return {};
  const auto message = parseMessage(*options_.type, bytesOf(encoding_), PayloadPairing::closed());
  if (!message) return std::unexpected(failureOf(message.error()));
  return {};
}

Outcome<OwnedMessage> MessageInput::message() const {
  auto message = parseMessage(*options_.type, bytesOf(encoding_), options_.payloads);
  if (!message && !isBytes(format_)) {
    message = parseMessage(*options_.type, bytesOf(encoding_), PayloadPairing::closed());
  }
  if (!message) return std::unexpected(failureOf(message.error()));
  return std::move(*message);
}

Failure MessageInput::failureOf(const DecodeError& error) const {
  const std::string path = error.path.text();
  return reader_->malformedBytes(frame_, error.offset, (path.empty() ? "" : path + ": ") + error.reason());
}

ExitStatus forEachMessage(const Options& options, OutputFile& output, MessageWork& work) {
  Progress progress(output.isTerminal());
  ExitStatus status = ExitStatus::done;
  for (const std::string& path : options.files) {
    Outcome<void> outcome = takeMessages(path, options, output, work, progress);
    progress.clear();
    if (outcome) continue;
    if (auto flushed = output.flush(); !flushed) outcome = std::unexpected(flushed.error());
    report(outcome.error());
    if (output.hasFailed()) return outcome.error().status;
    if (status == ExitStatus::done) status = outcome.error().status;
  }
  const bool isKept = status == ExitStatus::done || (status == ExitStatus::malformed && work.showsErrors());
  auto finished = work.finish();
  if (finished) finished = isKept ? output.finish() : output.flush();
  if (!finished) {
    report(finished.error());
    return finished.error().status;
  }
  return status;
}

}  // namespace orv::tool
