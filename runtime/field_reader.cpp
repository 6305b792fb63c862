#include <orv/internal/field_reader.hpp>

#include <cassert>

#include <orv/utf8.hpp>

namespace orv::inline v0::internal {

// Outside the fast path what is wrong is found by a WireReader, which says it.

OutermostFrame& FieldReader::outermost(Frame& frame) noexcept {
  Frame* at = &frame;
  while (at->outer != nullptr) at = at->outer;
  // Only an OutermostFrame has none outside, and there is no type information to ask.
  return static_cast<OutermostFrame&>(*at);  // NOLINT(cppcoreguidelines-pro-type-static-cast-downcast)
}

OutermostFrame::OutermostFrame(std::span<const std::byte> input, ConflictHook hook,
                               const DecodeLimits& limits)
    : OutermostFrame(input.data(), hook) {
  allowance = {limits.listElements, limits.unknownFieldBytes};
  nesting = static_cast<std::uint8_t>(maximumNesting - std::min<int>(limits.nesting, maximumNesting));
  if (input.size() <= limits.inputBytes) return;
  isInputTooLarge = true;
  end = End::fault;
  cause = DecodeCause::inputTooLarge;
  length = detail = 0;
  depth = 0;
  numbers[0] = 0;
  at = inputBegin + limits.inputBytes;
}

std::size_t FieldReader::allowElements(std::size_t held, WireReader input, Tag tag,
                                       OutermostFrame& outermost) noexcept {
  constexpr std::size_t firstFew = 8;
  using enum WireReader::Others;
  const std::size_t later =
      held == 0 ? input.countFollowing(tag, firstFew - 1, endTheCount)
                : input.countFollowing(tag, std::numeric_limits<std::size_t>::max(), arePassedOver);
  const std::size_t wanted = std::max(1 + later, held <= firstFew ? 0 : held);
  const std::size_t allowed = std::min(wanted, outermost.allowance.listElements);
  outermost.allowance.listElements -= allowed;
  return allowed;
}

Step FieldReader::askHook(Frame& frame) {
  if (frame.mode == Frame::Mode::confirmed) return {};
  OutermostFrame& outermost = FieldReader::outermost(frame);
  const auto answer = outermost.conflictHook();
  if (answer) return {};
  outermost.end = OutermostFrame::End::refusal;
  outermost.refusal = answer.error();
  return std::unexpected(Failed());
}

void FieldReader::note(DecodeCause cause, const std::byte* at, std::uint32_t length, std::uint32_t detail,
                       Frame& frame, std::uint32_t number) noexcept {
  OutermostFrame& outermost = FieldReader::outermost(frame);
  outermost.end = OutermostFrame::End::fault;
  outermost.cause = cause;
  outermost.at = at;
  outermost.length = length;
  outermost.detail = detail;
  outermost.depth = static_cast<std::uint8_t>(frame.nesting - outermost.nesting);
  if (cause == DecodeCause::nestingTooDeep)
    outermost.length = static_cast<std::uint32_t>(maximumNesting - outermost.nesting);
  for (const Frame* inner = &frame; inner != nullptr; number = inner->number, inner = inner->outer) {
    const std::size_t depth = inner->nesting - outermost.nesting;
    if (depth < outermost.numbers.size()) outermost.numbers[depth] = number;
  }
}

void OutermostFrame::describe(DecodeError& error) const {
  assert(end != End::none && "only what has failed has an error");
  if (end == End::refusal) {
    error = *refusal;
    return;
  }
  error.cause = cause;
  error.length = length;
  error.detail = detail;
  error.offset = static_cast<std::size_t>(at - inputBegin);
  const std::size_t size = std::size_t{depth} + 1;
  const std::size_t kept = std::min(size, FieldPath::capacity);
  error.path.assign(*outermostMessage, std::span(numbers).first(kept), size - kept);
}

// Neighbours that are unknown too are kept in the same step.
const std::byte* FieldReader::keepUnknown(Place place, Tag tag, Frame& frame,
                                          const MessageDescriptor& message, UnknownStorage& unknownFields) {
  const std::byte* const first = place.record;
  const std::byte* record = place.record;
  WireReader reader(std::span(place.value, place.end));
  std::size_t& allowed = outermost(frame).allowance.unknownFieldBytes;
  for (;;) {
    const auto skipped = reader.skipValue(tag, record, frame.nesting);
    const bool isAllowed = static_cast<std::size_t>(reader.position() - first) <= allowed;
    if (!skipped || !isAllowed) {
      unknownFields.appendRecords(std::span(first, record));
      if (skipped)
        note(DecodeCause::tooMuchUnknown, record, 0, 0, frame, tag.fieldNumber());
      else
        note(skipped.error(), frame, tag.fieldNumber());
      return nullptr;
    }
    record = reader.position();
    WireReader ahead = reader;
    if (ahead.isAtEnd()) break;
    const auto next = ahead.readTag();
    if (!next || message.field(next->fieldNumber()) != nullptr) break;
    tag = *next;
    reader = ahead;
  }
  allowed -= static_cast<std::size_t>(record - first);
  unknownFields.appendRecords(std::span(first, record));
  return record;
}

FieldReader::Read<Tag> FieldReader::readLongTag(const std::byte* at, const std::byte* end,
                                                Frame& frame) noexcept {
  WireReader reader(std::span(at, end));
  const auto tag = reader.readTag();
  if (tag) return {reader.position(), *tag};
  note(tag.error(), frame, 0);
  return {nullptr, Tag{0}};
}

FieldReader::Read<std::uint64_t> FieldReader::readLongVarint(const std::byte* at, const std::byte* end,
                                                             Frame& frame, Tag tag) noexcept {
  WireReader reader(std::span(at, end));
  const auto varint = reader.readVarint();
  if (varint) return {reader.position(), *varint};
  note(varint.error(), frame, tag.fieldNumber());
  return {nullptr, 0};
}

std::span<const std::byte> FieldReader::readLongBody(const std::byte* at, const std::byte* end, Frame& frame,
                                                     Tag tag) noexcept {
  // A length of two bytes is common.
  if (end - at >= 2) {
    const auto low = std::to_integer<std::size_t>(at[0]);
    const auto high = std::to_integer<std::size_t>(at[1]);
    const std::size_t length = (low & 0x7F) | high << 7;
    if (low >= 0x80 && high < 0x80 && length <= static_cast<std::size_t>(end - at - 2)) [[likely]]
      return {at + 2, length};
    if (low < 0x80 && low <= static_cast<std::size_t>(end - at - 1)) return {at + 1, low};
  }
  const auto body = WireReader(std::span(at, end)).readLengthDelimited();
  if (body) return *body;
  note(body.error(), frame, tag.fieldNumber());
  return {};
}

std::string_view FieldReader::readLongText(const std::byte* at, const std::byte* end, Frame& frame,
                                           Tag tag) noexcept {
  const std::span<const std::byte> body = readLongBody(at, end, frame, tag);
  if (body.data() == nullptr) return {};
  const std::string_view text(reinterpret_cast<const char*>(body.data()), body.size());
  const std::size_t wellFormed = utf8::wellFormedPrefix(text);
  if (wellFormed == text.size()) return text;
  note(DecodeCause::illFormedText, body.data(), static_cast<std::uint32_t>(text.size()),
       static_cast<std::uint32_t>(wellFormed), frame, tag.fieldNumber());
  return {};
}

Step FieldReader::failTooDeep(const std::byte* record, Frame& frame, Tag tag) noexcept {
  note(DecodeCause::nestingTooDeep, record, 0, 0, frame, tag.fieldNumber());
  return std::unexpected(Failed());
}

}  // namespace orv::internal
