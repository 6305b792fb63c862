#include <orv/stream_error.hpp>

#include <array>
#include <cstddef>
#include <ostream>

namespace orv::inline v0 {

namespace {

// In the order of StreamError::Cause.
constexpr std::array<std::string_view, 5> streamSentences{
    "the stream could not be read",
    "the stream ends inside a message",
    "length of 2^31 or more, or spelled in more than five bytes",
    "message longer than is allowed",
    "malformed message",
};
static_assert(streamSentences.size() == static_cast<std::size_t>(StreamError::Cause::malformedMessage) + 1);

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

std::ostream& operator<<(std::ostream& out, StreamError::Cause cause) { return out << describe(cause); }
std::ostream& operator<<(std::ostream& out, const StreamError& error) { return out << error.message(); }

}  // namespace orv
