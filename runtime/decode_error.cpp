#include <orv/decode_error.hpp>

#include <algorithm>

namespace orv::inline v0 {

namespace {

// In the order of DecodeCause.
constexpr std::array<std::string_view, 16> sentences{
    "the input ends inside a record",
    "length runs past the end",
    "length of 2^31 or more, or spelled in more than five bytes",
    "tag of more than five bytes or above 2^32-1",
    "field number 0",
    "reserved wire type",
    "varint of more than ten bytes",
    "end of a group that was not begun",
    "end of a group with another number than its start",
    "group without its end",
    "ill-formed UTF-8",
    "messages and groups nested deeper than 100",
    "a second member of a oneof was refused",
    "more bytes of input than the limit allows",
    "more elements of lists than the limit allows",
    "more bytes of unknown fields than the limit allows",
};
static_assert(sentences.size() == static_cast<std::size_t>(DecodeCause::tooMuchUnknown) + 1);

}  // namespace

std::string_view describe(DecodeCause cause) { return sentences[static_cast<std::size_t>(cause)]; }

std::string FieldPath::text() const {
  if (isEmpty()) return {};
  std::string text(outermost_->fullName);
  const MessageDescriptor* message = outermost_;
  for (std::size_t at = 0; at < size_ && numbers_[at] != 0; ++at) {
    const FieldDescriptor* const field = message != nullptr ? message->field(numbers_[at]) : nullptr;
    text += '.';
    text += field != nullptr ? field->name : std::to_string(numbers_[at]);
    message = field != nullptr ? field->message : nullptr;
  }
  if (omitted_ != 0) text += ".(" + std::to_string(omitted_) + " deeper)";
  return text;
}

std::string DecodeError::reason() const {
  switch (cause) {
    case DecodeCause::lengthOverrun:
      return "length " + std::to_string(length) + " runs " + std::to_string(detail) +
             (detail == 1 ? " byte" : " bytes") + " past the end";
    case DecodeCause::illFormedText:
      return "ill-formed UTF-8 at byte " + std::to_string(detail) + " of a text of " + std::to_string(length);
    case DecodeCause::nestingTooDeep:
      return "messages and groups nested deeper than " + std::to_string(length);
    default: return std::string(describe(cause));
  }
}

std::string DecodeError::message() const {
  std::string text = path.text();
  if (!text.empty()) text += ": ";
  return text + reason() + ", at byte " + std::to_string(offset);
}

}  // namespace orv
