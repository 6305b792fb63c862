#include "tools/orv/message_input.hpp"

#include <span>
#include <utility>

#include <orv/json/document.hpp>
#include "tools/orv/text_form.hpp"

namespace orv::tool {

Outcome<bool> MessageInput::next() {
  auto frame = reader_.next();
  if (!frame) return std::unexpected(std::move(frame.error()));
  if (!frame->has_value()) return false;
  frame_ = **frame;
  encoding_ = frame_.content;
  if (isBytes(format_)) return true;
  auto encoded = format_ == Format::json ? encodeJson() : encodeText();
  if (!encoded) return std::unexpected(std::move(encoded.error()));
  encoding_ = encoded_;
  return true;
}

Outcome<void> MessageInput::encodeText() {
  auto encoded = encodeTextForm(*options_.type, frame_.content, options_.payloads);
  if (!encoded) {
    const TextFault& fault = encoded.error();
    return std::unexpected(reader_.malformedText(frame_, fault.line, fault.column, fault.reason));
  }
  encoded_ = std::move(*encoded);
  return {};
}

Outcome<void> MessageInput::encodeJson() {
  const auto failure = [&](const json::Error& error) {
    if (!error.path.empty()) return std::unexpected(reader_.malformed(frame_, error.message()));
    return std::unexpected(reader_.malformedText(frame_, error.line, error.column, error.reason));
  };
  const auto document = json::Document::parse(frame_.content);
  if (!document) return failure(document.error());
  const auto message = readJsonMessage(*options_.type, document->root(), options_.payloads);
  if (!message) return failure(message.error());
  auto encoded = (*message)->serialize();
  if (!encoded) return std::unexpected(reader_.malformed(frame_, describe(encoded.error())));
  encoded_ = std::move(*encoded);
  return {};
}

Outcome<void> MessageInput::check() const {
  if (!isBytes(format_)) return {};
  PayloadPairing closed;
  closed.leaveClosed();
  const auto message = parseMessage(*options_.type, std::as_bytes(std::span(encoding_)), closed);
  if (!message) return std::unexpected(failureOf(message.error()));
  return {};
}

Outcome<AnyMessage> MessageInput::message() const {
  const auto bytes = std::as_bytes(std::span(encoding_));
  auto message = parseMessage(*options_.type, bytes, options_.payloads);
  if (!message && !isBytes(format_)) {
    PayloadPairing closed;
    closed.leaveClosed();
    message = parseMessage(*options_.type, bytes, closed);
  }
  if (!message) return std::unexpected(failureOf(message.error()));
  return std::move(*message);
}

Failure MessageInput::failureOf(const DecodeError& error) const {
  const std::string path = error.path.text();
  return reader_.malformedBytes(frame_, error.offset, (path.empty() ? "" : path + ": ") + error.reason());
}

Outcome<MessageFile> MessageFile::open(const std::string& path, const Options& options) {
  auto file = InputFile::open(path);
  if (!file) return std::unexpected(std::move(file.error()));
  auto input = std::make_unique<InputFile>(std::move(*file));
  const Format format = options.from.value_or(Format::binary);
  auto frames = FrameReader::make(*input, {format, options.isDelimited, options.maximumSize});
  auto messages = std::make_unique<MessageInput>(*frames, format, options);
  return MessageFile{format, std::move(input), std::move(frames), std::move(messages)};
}

}  // namespace orv::tool
