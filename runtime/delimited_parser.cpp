#include <orv/delimited_parser.hpp>

#include <algorithm>
#include <cstring>
#include <limits>

namespace orv::inline v0 {

namespace {

constexpr std::uint64_t largestMessage = std::numeric_limits<std::int32_t>::max();

}  // namespace

void DelimitedParser::push(ByteView bytes) {
  if (bytes.size() == 0) return;
  makeRoom(bytes.size());
  std::memcpy(buffer_.get() + end_, bytes.characters().data(), bytes.size());
  end_ += bytes.size();
}

// What is waiting is moved no more often than as many bytes were popped or pushed, so that all pushes together
// take time in proportion to their bytes.
void DelimitedParser::makeRoom(std::size_t size) {
  if (size <= capacity_ - end_) return;
  const std::size_t kept = end_ - begin_;
  if (kept <= begin_ && size <= capacity_ - kept) {
    std::memcpy(buffer_.get(), buffer_.get() + begin_, kept);
  } else {
    const std::size_t capacity = std::max(kept + size, 2 * kept);
    auto larger = std::make_unique_for_overwrite<std::byte[]>(capacity);
    if (kept != 0) std::memcpy(larger.get(), buffer_.get() + begin_, kept);
    buffer_ = std::move(larger);
    capacity_ = capacity;
  }
  begin_ = 0;
  end_ = kept;
}

std::expected<std::optional<std::span<const std::byte>>, StreamError> DelimitedParser::next() {
  if (error_.has_value()) return std::unexpected(*error_);
  constexpr std::size_t longestLength = 5;
  const std::span<const std::byte> bytes = waiting();
  std::uint64_t length = 0;
  for (std::size_t at = 0; at < longestLength; ++at) {
    if (at == bytes.size()) return std::nullopt;
    length |= std::to_integer<std::uint64_t>(bytes[at] & std::byte{0x7F}) << (7 * at);
    if (bytes[at] >= std::byte{0x80}) continue;
    if (length > largestMessage) return fail(StreamError::Cause::malformedLength);
    if (length > limits_.inputBytes) return fail(StreamError::Cause::tooLarge, length);
    const std::span<const std::byte> body = bytes.subspan(at + 1);
    if (body.size() < length) return std::nullopt;
    messageOffset_ = offset_ + at + 1;
    offset_ = messageOffset_ + length;
    begin_ = end_ - body.size() + static_cast<std::size_t>(length);
    return body.first(static_cast<std::size_t>(length));
  }
  return fail(StreamError::Cause::malformedLength);
}

std::expected<void, StreamError> DelimitedParser::finish() {
  if (error_.has_value()) return std::unexpected(*error_);
  if (begin_ != end_) return fail(StreamError::Cause::truncated);
  return {};
}

std::unexpected<StreamError> DelimitedParser::fail(StreamError::Cause cause, std::uint64_t length) {
  error_ = StreamError{.cause = cause, .offset = offset_, .length = length};
  return std::unexpected(*error_);
}

StreamError DelimitedParser::malformedMessage(const DecodeError& error) const {
  return {.cause = StreamError::Cause::malformedMessage,
          .offset = messageOffset_ + error.offset,
          .length = 0,
          .decodeError = error};
}

}  // namespace orv
