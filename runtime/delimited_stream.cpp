#include <orv/delimited_stream.hpp>

#include <google/protobuf/io/coded_stream.h>
#include <google/protobuf/io/zero_copy_stream_impl_lite.h>

#include <algorithm>
#include <array>
#include <cassert>
#include <cstring>
#include <functional>
#include <limits>
#include <ostream>
#include <string_view>
#include <vector>

#include <orv/binary_encoder.hpp>
#include <orv/internal/varint.hpp>

namespace orv::inline v0 {

namespace {

namespace io = google::protobuf::io;

// In the order of StreamError::Cause.
constexpr std::array<std::string_view, 5> streamSentences{
    "the stream could not be read",
    "the stream ends inside a message",
    "length of 2^31 or more, or spelled in more than five bytes",
    "message longer than is allowed",
    "malformed message",
};
static_assert(streamSentences.size() == static_cast<std::size_t>(StreamError::Cause::malformedMessage) + 1);

// The read function as libprotobuf's streams see it.
class ReadFunctionStream final : public io::CopyingInputStream {
 public:
  explicit ReadFunctionStream(ReadFunction read) : read_(std::move(read)) {}

  int Read(void* buffer, int size) override {
    const std::ptrdiff_t count =
        read_(std::span(static_cast<std::byte*>(buffer), static_cast<std::size_t>(size)));
    const bool isPossible = count >= 0 && count <= size;
    hasFailed_ = hasFailed_ || !isPossible;
    return isPossible ? static_cast<int>(count) : -1;
  }
  bool hasFailed() const { return hasFailed_; }

 private:
  ReadFunction read_;
  bool hasFailed_ = false;
};

}  // namespace

std::string_view describe(StreamError::Cause cause) {
  return streamSentences[static_cast<std::size_t>(cause)];
}

std::string StreamError::reason() const {
  if (decodeError.has_value()) return decodeError->reason();
  std::string text(describe(cause));
  if (cause == Cause::tooLarge) text += " (" + std::to_string(length) + " bytes)";
  return text;
}

std::string StreamError::message() const {
  std::string text = decodeError.has_value() ? decodeError->path.text() : "";
  if (!text.empty()) text += ": ";
  return text + reason() + ", at byte " + std::to_string(offset);
}

class DelimitedReader::Source {
 public:
  Source(ReadFunction read, const DecodeLimits& limits)
      : stream_(std::move(read)), buffered_(&stream_), limits_(limits) {}

  std::expected<std::optional<std::span<const std::byte>>, StreamError> next();
  std::uint64_t messageOffset() const { return messageOffset_; }
  const DecodeLimits& limits() const { return limits_; }

 private:
  std::unexpected<StreamError> fail(StreamError::Cause cause, std::uint64_t length = 0) {
    const auto actual = stream_.hasFailed() ? StreamError::Cause::readFailed : cause;
    error_ = StreamError{.cause = actual, .offset = messageOffset_, .length = length};
    return std::unexpected(*error_);
  }

  ReadFunctionStream stream_;
  io::CopyingInputStreamAdaptor buffered_;
  DecodeLimits limits_;
  std::uint64_t messageOffset_ = 0;
  std::uint64_t nextOffset_ = 0;
  std::vector<std::byte> message_;
  std::optional<StreamError> error_;  // after it no more is read
};

std::expected<std::optional<std::span<const std::byte>>, StreamError> DelimitedReader::Source::next() {
  if (error_.has_value()) return std::unexpected(*error_);
  messageOffset_ = nextOffset_;
  // It stands if memory runs out on the way, or the read function throws: nobody knows then where the stream is.
  error_ = StreamError{.cause = StreamError::Cause::readFailed, .offset = messageOffset_};

  // One stream for the length and one for the message: each counts what it reads in an int.
  std::optional<io::CodedInputStream> input(std::in_place, &buffered_);
  constexpr int longestLength = 5;
  std::uint64_t length = 0;
  int lengthSize = 0;
  for (std::uint8_t byte = 0x80; byte >= 0x80; ++lengthSize) {
    if (lengthSize == longestLength) return fail(StreamError::Cause::malformedLength);
    if (!input->ReadRaw(&byte, 1)) {
      if (lengthSize == 0 && !stream_.hasFailed()) {
        error_.reset();
        return std::nullopt;
      }
      return fail(StreamError::Cause::truncated);
    }
    length |= std::uint64_t{byte & 0x7FU} << (7 * lengthSize);
  }
  if (length > std::numeric_limits<std::int32_t>::max()) return fail(StreamError::Cause::malformedLength);
  if (length > limits_.inputBytes) return fail(StreamError::Cause::tooLarge, length);

  message_.clear();
  // The constructor reads ahead, which would wait for ever where nothing follows an empty message.
  if (length != 0) input.emplace(&buffered_);
  // Room is made for what arrives, piece by piece, not for all that is announced.
  while (message_.size() < length) {
    constexpr std::size_t firstPiece = std::size_t{64} << 10;
    const std::size_t had = message_.size();
    const std::size_t piece = std::min(static_cast<std::size_t>(length) - had, std::max(firstPiece, had));
    message_.resize(had + piece);
    if (!input->ReadRaw(message_.data() + had, static_cast<int>(piece)))
      return fail(StreamError::Cause::truncated);
  }
  messageOffset_ += static_cast<std::uint64_t>(lengthSize);
  nextOffset_ = messageOffset_ + length;
  error_.reset();
  return std::span<const std::byte>(message_);
}

DelimitedReader::DelimitedReader(ReadFunction read, const DecodeLimits& limits)
    : source_(std::make_unique<Source>(std::move(read), limits)) {}
DelimitedReader::DelimitedReader(DelimitedReader&&) noexcept = default;
DelimitedReader& DelimitedReader::operator=(DelimitedReader&&) noexcept = default;
DelimitedReader::~DelimitedReader() = default;

std::expected<std::optional<std::span<const std::byte>>, StreamError> DelimitedReader::next() {
  assert(source_ != nullptr && "a reader that was moved from reads nothing");
  return source_->next();
}

const DecodeLimits& DelimitedReader::limits() const { return source_->limits(); }

std::uint64_t DelimitedReader::messageOffset() const {
  assert(source_ != nullptr && "a reader that was moved from has no place");
  return source_->messageOffset();
}

StreamError DelimitedReader::malformedMessage(const DecodeError& error) const {
  return {.cause = StreamError::Cause::malformedMessage,
          .offset = messageOffset() + error.offset,
          .length = 0,
          .decodeError = error};
}

std::expected<void, EncodeError> appendDelimited(std::string_view bytes, std::string& output) {
  if (bytes.size() > BinaryEncoder::largestEncoding) return std::unexpected(EncodeError::tooLarge);
  // The bytes may be the output's own, which move when it grows.
  const std::size_t before = output.size();
  const bool areOwn = std::greater_equal<>()(bytes.data(), output.data()) &&
                      std::less_equal<>()(bytes.data(), output.data() + before);
  const std::size_t ownAt = areOwn ? static_cast<std::size_t>(bytes.data() - output.data()) : 0;
  const auto length = static_cast<std::uint32_t>(bytes.size());
  const std::size_t size = before + internal::varintSize(length) + bytes.size();
  output.resize_and_overwrite(size, [&](char* begin, std::size_t) {
    auto* const lengthAt = reinterpret_cast<std::uint8_t*>(begin + before);
    auto* const target = io::CodedOutputStream::WriteVarint32ToArray(length, lengthAt);
    if (!bytes.empty()) std::memcpy(target, areOwn ? begin + ownAt : bytes.data(), bytes.size());
    return size;
  });
  return {};
}

std::ostream& operator<<(std::ostream& out, StreamError::Cause cause) { return out << describe(cause); }
std::ostream& operator<<(std::ostream& out, const StreamError& error) { return out << error.message(); }

}  // namespace orv
