#include "tools/orv/input/frame_reader.hpp"

#include <array>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/delimited_stream.hpp>
#include <orv/spelling/hex.hpp>
#include "tools/orv/input/text_stream.hpp"

namespace orv::tool {

namespace {

// Input that is one message, read as a whole.
class WholeInput final : public FrameReader {
 public:
  WholeInput(InputFile& file, Format format, const Options& options)
      : FrameReader(file.name(), options.maximumSize), source_(file, format, options) {}

  Outcome<std::optional<Frame>> next() override {
    if (std::exchange(isRead_, true)) return std::nullopt;
    std::array<std::byte, 65536> piece;
    for (;;) {
      const std::ptrdiff_t count = source_.read(piece);
      if (count < 0) return std::unexpected(source_.failure());
      if (count == 0) break;
      const auto size = static_cast<std::size_t>(count);
      if (size > maximumSize() - content_.size()) return failTooLarge({});
      content_ += charactersOf(std::span(piece).first(size));
    }
    return Frame{.content = content_};
  }

 private:
  ByteSource source_;
  std::string content_;
  bool isRead_ = false;
};

// Encodings, each behind its length.
class DelimitedInput final : public FrameReader {
 public:
  DelimitedInput(InputFile& file, Format format, const Options& options)
      : FrameReader(file.name(), options.maximumSize),
        source_(file, format, options),
        reader_([this](std::span<std::byte> buffer) { return source_.read(buffer); }, options.maximumSize) {}

  Outcome<std::optional<Frame>> next() override {
    ++number_;
    const auto bytes = reader_.next();
    if (!bytes) return std::unexpected(failureOf(bytes.error()));
    if (!bytes->has_value()) return std::nullopt;
    return Frame{.content = charactersOf(**bytes), .number = number_, .offset = reader_.messageOffset()};
  }

 private:
  Failure failureOf(const StreamError& error) const {
    if (error.cause == StreamError::Cause::readFailed) return source_.failure();
    const Frame frame{.number = number_, .offset = error.offset};
    if (error.cause == StreamError::Cause::tooLarge) {
      return malformedBytes(frame, 0,
                            "length " + std::to_string(error.length) + " is above " +
                                std::to_string(maximumSize()) + ", the most that --max-size allows");
    }
    return malformedBytes(frame, 0, error.reason());
  }

  ByteSource source_;
  DelimitedReader reader_;
  std::uint64_t number_ = 0;
};

}  // namespace

std::string bytePlace(std::uint64_t offset) {
  return "byte " + std::to_string(offset) + " (0x" + spelling::hexNumber(offset, 4) + ")";
}

std::unique_ptr<FrameReader> FrameReader::make(InputFile& file, Format format, const Options& options) {
  if (!options.isDelimited) return std::make_unique<WholeInput>(file, format, options);
  if (isBytes(format)) return std::make_unique<DelimitedInput>(file, format, options);
  return std::make_unique<TextStream>(file, format, options.maximumSize);
}

std::unexpected<Failure> FrameReader::failTooLarge(const Frame& frame) const {
  return std::unexpected(malformed(frame, "message of more than " + std::to_string(maximumSize_) +
                                              " bytes, the most that --max-size allows"));
}

Failure FrameReader::malformed(const Frame& frame, std::string_view reason) const {
  std::string line = fileName_;
  if (frame.number != 0) line += ": message " + std::to_string(frame.number);
  line += ": ";
  line += reason;
  return {ExitStatus::malformed, std::move(line), Extent::rest, std::string(reason)};
}

Failure FrameReader::malformedBytes(const Frame& frame, std::uint64_t offset, std::string_view reason) const {
  return malformed(frame, bytePlace(frame.offset + offset) + ": " + std::string(reason));
}

Failure FrameReader::malformedText(const Frame& frame, spelling::TextError error) const {
  if (error.line == 1) error.column += frame.column - 1;
  error.line += frame.line - 1;
  return malformed(frame, error.message());
}

}  // namespace orv::tool
