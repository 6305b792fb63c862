#include "tools/orv/frame_reader.hpp"

#include <array>
#include <utility>

#include <orv/delimited_stream.hpp>
#include "tools/orv/byte_source.hpp"
#include "tools/orv/text_stream.hpp"
#include "tools/orv/value_text.hpp"

namespace orv::tool {

namespace {

std::string tooLarge(std::size_t maximumSize) {
  return "message of more than " + std::to_string(maximumSize) + " bytes, the most that --max-size allows";
}

// Input that is one message, read as a whole.
class WholeInput final : public FrameReader {
 public:
  WholeInput(InputFile& file, FrameOptions options)
      : FrameReader(file.name()), source_(file, options.format), maximumSize_(options.maximumSize) {}

  Outcome<std::optional<Frame>> next() override {
    if (std::exchange(isRead_, true)) return std::nullopt;
    const Frame empty{.content = {}, .number = 0, .offset = 0, .line = 1};
    std::array<std::byte, 65536> piece;
    for (;;) {
      const std::ptrdiff_t count = source_.read(piece);
      if (count < 0) return std::unexpected(source_.failure());
      if (count == 0) break;
      const auto size = static_cast<std::size_t>(count);
      if (size > maximumSize_ - content_.size())
        return std::unexpected(malformed(empty, tooLarge(maximumSize_)));
      content_.append(reinterpret_cast<const char*>(piece.data()), size);
    }
    Frame whole = empty;
    whole.content = content_;
    return whole;
  }

 private:
  ByteSource source_;
  std::size_t maximumSize_;
  std::string content_;
  bool isRead_ = false;
};

// Encodings, each behind its length.
class DelimitedInput final : public FrameReader {
 public:
  DelimitedInput(InputFile& file, FrameOptions options)
      : FrameReader(file.name()),
        source_(file, options.format),
        reader_([this](std::span<std::byte> buffer) { return source_.read(buffer); }, options.maximumSize),
        maximumSize_(options.maximumSize) {}

  Outcome<std::optional<Frame>> next() override {
    ++number_;
    const auto bytes = reader_.next();
    if (!bytes) return std::unexpected(failureOf(bytes.error()));
    if (!bytes->has_value()) return std::nullopt;
    const std::string_view content(reinterpret_cast<const char*>((*bytes)->data()), (*bytes)->size());
    return Frame{.content = content, .number = number_, .offset = reader_.messageOffset(), .line = 1};
  }

 private:
  Failure failureOf(const StreamError& error) const {
    if (error.cause == StreamError::Cause::readFailed) return source_.failure();
    const Frame frame{.content = {}, .number = number_, .offset = error.offset, .line = 1};
    if (error.cause == StreamError::Cause::tooLarge) {
      return malformedBytes(frame, 0,
                            "length " + std::to_string(error.length) + " is above " +
                                std::to_string(maximumSize_) + ", the most that --max-size allows");
    }
    const std::string message = error.message();
    return malformedBytes(frame, 0, message.substr(0, message.rfind(", at byte")));
  }

  ByteSource source_;
  DelimitedReader reader_;
  std::size_t maximumSize_;
  std::uint64_t number_ = 0;
};

// Documents or texts, one after the other.
class TextInput final : public FrameReader {
 public:
  TextInput(InputFile& file, FrameOptions options)
      : FrameReader(file.name()),
        stream_(file, options.format == Format::json ? TextStream::Kind::json : TextStream::Kind::text,
                options.maximumSize),
        maximumSize_(options.maximumSize) {}

  Outcome<std::optional<Frame>> next() override {
    Frame frame{.content = {}, .number = ++number_, .offset = 0, .line = 1};
    switch (stream_.next()) {
      case TextStream::Step::end: return std::nullopt;
      case TextStream::Step::readFailed: return failWithErrno(fileName());
      case TextStream::Step::tooLarge: return std::unexpected(malformed(frame, tooLarge(maximumSize_)));
      case TextStream::Step::text: break;
    }
    frame.content = stream_.text();
    frame.offset = stream_.offset();
    frame.line = stream_.line();
    return frame;
  }

 private:
  TextStream stream_;
  std::size_t maximumSize_;
  std::uint64_t number_ = 0;
};

}  // namespace

std::unique_ptr<FrameReader> FrameReader::make(InputFile& file, FrameOptions options) {
  if (!options.isDelimited) return std::make_unique<WholeInput>(file, options);
  if (isBytes(options.format)) return std::make_unique<DelimitedInput>(file, options);
  return std::make_unique<TextInput>(file, options);
}

Failure FrameReader::malformed(const Frame& frame, std::string_view reason) const {
  std::string line = fileName_;
  if (frame.number != 0) line += ": message " + std::to_string(frame.number);
  line += ": ";
  line += reason;
  return {ExitStatus::malformed, std::move(line)};
}

Failure FrameReader::malformedBytes(const Frame& frame, std::uint64_t offset, std::string_view reason) const {
  return malformed(frame, bytePlace(frame.offset + offset) + ": " + std::string(reason));
}

Failure FrameReader::malformedText(const Frame& frame, std::size_t line, std::size_t column,
                                   std::string_view reason) const {
  const std::string place =
      "line " + std::to_string(frame.line + line - 1) + ", column " + std::to_string(column) + ": ";
  return malformed(frame, place + std::string(reason));
}

}  // namespace orv::tool
