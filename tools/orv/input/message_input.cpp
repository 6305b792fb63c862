#include "tools/orv/input/message_input.hpp"

#include <algorithm>
#include <span>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/json/document.hpp>
#include <orv/utf8.hpp>
#include <orv/wire_reader.hpp>
#include "tools/orv/messages/text_form.hpp"
#include "tools/orv/output/progress.hpp"

namespace orv::tool {

namespace {

template <class Reader>
bool isSpelledFor(Reader reader, std::string_view text) {
  std::string bytes;
  return reader.take(text, bytes) && (!bytes.empty() || reader.finish(bytes)) && !bytes.empty();
}

bool isMessageOf(const MessageType& type, std::span<const std::byte> bytes) {
  return parseMessage(type, bytes, PayloadPairing::closed()).has_value();
}

// By what it begins with. An array is no message, but more likely meant for JSON than for an extension in the text
// format.
Format guessFormat(std::string_view beginning, std::span<const Format> possible, const MessageType& type) {
  if (beginning.starts_with(byteOrderMark)) beginning.remove_prefix(byteOrderMark.size());
  constexpr std::string_view blanks = " \t\r\n";
  constexpr std::string_view hexDigits = "0123456789abcdefABCDEF";
  const auto isControl = [&](char c) { return c >= 0 && c < ' ' && !blanks.contains(c); };
  const std::string_view text =
      beginning.substr(std::min(beginning.size(), beginning.find_first_not_of(blanks)));
  if (text.starts_with('{') || text.starts_with('[')) return Format::json;
  if (std::ranges::find(possible, Format::binary) == possible.end()) return Format::text;
  if (std::ranges::any_of(beginning, isControl) || !utf8::isWellFormed(text)) return Format::binary;
  // A bare message may begin with what looks like a line's end.
  if (beginning.starts_with('\n') && isMessageOf(type, bytesOf(beginning))) return Format::binary;
  const std::string_view word = text.substr(0, text.find_first_of(" \t\r\n:{<"));
  const auto behind = text.find_first_not_of(" \t", word.size());
  const bool isField = behind != std::string_view::npos && std::string_view(":{<").contains(text[behind]);
  if (text.starts_with('#') || (isField && word.find_first_not_of(hexDigits) != std::string_view::npos))
    return Format::text;
  if (isSpelledFor(spelling::HexReader(), text)) return Format::hex;
  const bool isOneWord = text.substr(0, text.find('\n')).find(' ') == std::string_view::npos;
  return isOneWord && isSpelledFor(spelling::Base64Reader(), text) ? Format::base64 : Format::text;
}

// Whether the bytes are messages behind their lengths, the first of them of the type.
bool isStreamOf(const MessageType& type, std::span<const std::byte> bytes) {
  WireReader reader(bytes);
  const auto first = reader.readLengthDelimited();
  if (!first || !isMessageOf(type, *first)) return false;
  while (!reader.isAtEnd()) {
    if (!reader.readLengthDelimited()) return false;
  }
  return true;
}

// Tells of what failed, behind the output that came before it.
Outcome<void> reportInPlace(const Failure& failure, OutputFile& output, Progress& progress) {
  progress.clear();
  if (auto flushed = output.flush(); !flushed) return flushed;
  report(failure);
  return {};
}

// A failure of which only a part was lost leaves the output as it should be.
Outcome<void> takeMessages(const std::string& path, const Options& options, OutputFile& output,
                           MessageWork& work, Progress& progress) {
  const auto opened = MessageInput::open(path, options, output);
  if (!opened) return std::unexpected(opened.error());
  MessageInput& input = **opened;
  const Extent passable = options.keepsGoing ? Extent::message : Extent::part;
  std::uint64_t messages = 0;
  std::uint64_t malformed = 0;
  Outcome<void> outcome;
  for (;; ++messages) {
    const auto hasNext = input.next();
    if (hasNext && !*hasNext) break;
    outcome = hasNext ? work.take(input) : std::unexpected(hasNext.error());
    if (!outcome && outcome.error().extent > passable) {
      if (hasNext) break;
      if (auto taken = work.takeEnd(hasNext.error()); !taken) return taken;
      break;
    }
    if (!outcome) {
      ++malformed;
      outcome.error().extent = Extent::part;
      if (!options.isDelimited) break;
      outcome = reportInPlace(outcome.error(), output, progress);
      if (!outcome) return outcome;
    }
    progress.update(input.frame().number, input.frame().offset);
  }
  if (malformed == 0 || !options.isDelimited || output.hasFailed()) return outcome;
  const Extent extent = outcome ? Extent::part : Extent::rest;
  if (!outcome) outcome = reportInPlace(outcome.error(), output, progress);
  if (!outcome) return outcome;
  return std::unexpected(Failure{ExitStatus::malformed,
                                 input.name() + ": " + std::to_string(malformed) + " of " +
                                     std::to_string(messages) + " messages malformed",
                                 extent});
}

}  // namespace

MessageInput::MessageInput(InputFile file, const std::string& path, const Options& options)
    : file_(std::move(file)),
      path_(path),
      options_(options),
      format_(options.from ? *options.from
                           : guessFormat(file_.beginning(), options.possibleFormats, *options.type)),
      reader_(FrameReader::make(file_, format_, options)) {
  if (format_ != Format::binary) file_.skipByteOrderMark();
  if (!options.from && options.isVerbose) {
    report({ExitStatus::done, file_.name() + ": read as " + std::string(nameOf(format_))});
  }
}

Outcome<std::unique_ptr<MessageInput>> MessageInput::open(const std::string& path, const Options& options,
                                                          OutputFile& output) {
  auto file = InputFile::open(path, output);
  if (!file) return std::unexpected(std::move(file.error()));
  return std::unique_ptr<MessageInput>(new MessageInput(std::move(*file), path, options));
}

Outcome<bool> MessageInput::next() {
  for (;;) {
    auto isRead = nextFrame();
    if (!isRead || !*isRead || isSelected()) return isRead;
  }
}

// What is malformed is selected, so that it is told of.
bool MessageInput::isSelected() const {
  if (!options_.selection.hasConditions()) return true;
  auto read = message();
  if (!read) read = message(PayloadPairing::closed());
  return !read || options_.selection.takes(**read);
}

Outcome<bool> MessageInput::nextFrame() {
  for (bool isTaken = false; !isTaken; isTaken = options_.selection.takesNumber(frame_.number)) {
    if (options_.selection.isLast(frame_.number)) return false;
    const auto frame = reader_->next();
    if (!frame) return std::unexpected(frame.error());
    if (!frame->has_value()) return false;
    frame_ = **frame;
  }
  encoding_ = frame_.content;
  if (isBytes(format_)) return true;
  auto encoded = format_ == Format::json ? encodeJson() : encodeText();
  if (!encoded) {
    encoded.error().extent = Extent::message;
    return std::unexpected(std::move(encoded.error()));
  }
  encoded_ = std::move(*encoded);
  encoding_ = encoded_;
  return true;
}

Outcome<std::string> MessageInput::encodeText() const {
  auto encoded = encodeTextForm(*options_.type, frame_.content, options_.payloads);
  if (!encoded) return failText(encoded.error());
  return std::move(*encoded);
}

Outcome<std::string> MessageInput::encodeJson() const {
  const auto failure = [&](const json::Error& error) {
    return failText({error.path.empty() ? error.reason : error.message(), error.line, error.column});
  };
  const auto document = json::Document::parse(frame_.content);
  if (!document) return failure(document.error());
  const auto message = readJsonMessage(*options_.type, document->root(), options_.payloads);
  if (!message) return failure(message.error());
  auto encoded = (*message)->serialize();
  if (!encoded) return std::unexpected(reader_->malformed(frame_, describe(encoded.error())));
  return std::move(*encoded);
}

// Without a line the reason says the place.
std::unexpected<Failure> MessageInput::failText(spelling::TextError error) const {
  error = redacted(std::move(error), options_);
  return std::unexpected(error.line == 0 ? reader_->malformed(frame_, error.reason)
                                         : reader_->malformedText(frame_, std::move(error)));
}

Outcome<void> MessageInput::check() const {
  if (!isBytes(format_)) return {};
  const auto checked = message(PayloadPairing::closed());
  return checked ? Outcome<void>() : std::unexpected(checked.error());
}

Outcome<OwnedMessage> MessageInput::message(const PayloadPairing& payloads) const {
  auto message = parseMessage(*options_.type, bytesOf(encoding_), payloads);
  if (!message && !isBytes(format_)) {
    message = parseMessage(*options_.type, bytesOf(encoding_), PayloadPairing::closed());
  }
  if (!message) return std::unexpected(failureOf(message.error()));
  return std::move(*message);
}

Failure MessageInput::failureOf(const DecodeError& error) const {
  const std::string path = error.path.text();
  const bool isMessage = isMessageOf(*options_.type, bytesOf(encoding_));
  const bool isStream = !isMessage && !options_.isDelimited && isStreamOf(*options_.type, bytesOf(encoding_));
  Failure failure =
      reader_->malformedBytes(frame_, error.offset,
                              (path.empty() ? "" : path + ": ") + error.reason() +
                                  (isStream ? "; it looks like a stream: try --delimited" : ""));
  failure.extent = isMessage ? Extent::part : Extent::message;
  return failure;
}

ExitStatus forEachMessage(const Options& options, OutputFile& output, MessageWork& work) {
  Progress progress(output.isTerminal());
  ExitStatus status = ExitStatus::done;
  bool isComplete = true;
  for (const std::string& path : options.files) {
    const Outcome<void> outcome = takeMessages(path, options, output, work, progress);
    progress.clear();
    if (outcome) continue;
    isComplete = isComplete && outcome.error().extent == Extent::part;
    const auto told = output.hasFailed() ? outcome : reportInPlace(outcome.error(), output, progress);
    if (!told) {
      report(told.error());
      return told.error().status;
    }
    if (status == ExitStatus::done) status = outcome.error().status;
  }
  const bool isKept = isComplete || (status == ExitStatus::malformed && work.showsErrors());
  auto finished = work.finish();
  if (finished) finished = isKept ? output.finish() : output.flush();
  if (!finished) {
    report(finished.error());
    return finished.error().status;
  }
  return status;
}

}  // namespace orv::tool
