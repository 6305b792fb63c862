#include "tests/testing/properties.hpp"

#include <algorithm>
#include <optional>
#include <vector>

#include <orv/delimited_stream.hpp>
#include <orv/group.hpp>
#include <orv/text.hpp>
#include <orv/wire_reader.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/normal_form.hpp"

namespace orv::test {

std::string faultOfEncoding(const AnyMessage& message) {
  const auto encoded = message.serialize();
  if (!encoded) return "it cannot be encoded";
  if (message.encodedSize() != encoded->size()) return "encodedSize is not the size of the encoding";
  std::vector<std::byte> exact(encoded->size());
  const auto written = message.serializeInto(exact);
  if (!written || *written != exact.size()) return "it does not fit a buffer of its encoded size";
  if (!std::ranges::equal(exact, std::as_bytes(std::span(*encoded))))
    return "serializeInto writes other bytes";
  if (!exact.empty() && message.serializeInto(std::span(exact).first(exact.size() - 1)))
    return "it fits a buffer that is too small";

  const auto again = message.parse(*encoded);
  if (!again) return "its own encoding is refused: " + again.error().message();
  if (!(**again == message)) return "it is unequal to what its encoding gives";
  if ((*again)->hashValue() != message.hashValue()) return "it is hashed unlike its equal";
  if ((*again)->debugDescription() != message.debugDescription()) return "it is described unlike its equal";
  if ((*again)->serialize() != encoded) return "encoded again it has other bytes";
  return "";
}

std::string faultOfReading(const AnyMessage& type, std::string_view bytes) {
  const auto message = type.parse(bytes);
  const MessagePointer merged = type.copied();
  const auto result = merged->merge(bytes);
  if (message.has_value() != result.has_value()) return "parse and merge disagree";
  if (std::string fault = faultOfEncoding(*merged); !fault.empty()) return fault;
  const MessagePointer reused = merged->copied();
  if (reused->reparse(bytes) != result) return "reparse ends otherwise";
  if (!(*reused == *merged)) return "reparse leaves something else";
  if (!message) {
    if (message.error() != result.error()) return "parse and merge err differently";
    if (message.error().offset > bytes.size()) return "the error is outside the input";
    if (!message.error().message().starts_with(type.fullName())) return "the error names no field";
    return "";
  }
  if (!(**message == *merged)) return "parse and merge read different messages";

  // Reading two encodings one behind the other is reading one and merging the other.
  const auto twice = type.parse(std::string(bytes) + std::string(bytes));
  if (!twice) return "its encoding is refused when it stands there twice";
  if (!merged->merge(bytes) || !(*merged == **twice)) return "merging differs from reading on";
  return faultOfEncoding(*merged);
}

std::string faultOfMerging(const AnyMessage& type, std::string_view left, std::string_view right) {
  const std::string both = std::string(left) + std::string(right);
  const MessagePointer message = type.copied();
  auto result = message->merge(left);
  const bool isLeftRead = result.has_value();
  const MessagePointer before = message->copied();
  if (isLeftRead) result = message->merge(right);
  const MessagePointer whole = type.copied();
  const auto wholeResult = whole->merge(both);
  // What the left bytes are cut off from may make them whole.
  if (isLeftRead) {
    if (wholeResult.has_value() != result.has_value()) return "the bytes in one are read otherwise";
    if (!(*whole == *message)) return "the bytes in one give another message";
    if (!result && wholeResult.error().offset != left.size() + result.error().offset)
      return "the error moves";
  }
  // In the memory of a message that holds something.
  if (before->reparse(both) != wholeResult) return "memory that is used again changes the verdict";
  if (!(*before == *whole) || before->serialize() != whole->serialize()) return "reparse leaves a trace";
  if (before->hashValue() != whole->hashValue()) return "reparse leaves another hash";
  return "";
}

namespace {

// The outermost records, each by where it ends; up to the first that is malformed.
std::vector<std::size_t> recordEnds(std::string_view bytes) {
  const auto all = std::as_bytes(std::span(bytes));
  std::vector<std::size_t> ends;
  WireReader reader(all);
  while (!reader.isAtEnd()) {
    const std::byte* const start = reader.position();
    const auto tag = reader.readTag();
    if (!tag || !reader.skipValue(*tag, start, 1)) break;
    ends.push_back(static_cast<std::size_t>(reader.position() - all.data()));
  }
  return ends;
}

// Decodes with a hook that refuses at call `refused`, and counts its calls.
std::expected<void, DecodeError> decodeRefusing(AnyMessage& message, std::string_view bytes,
                                                std::size_t refused, const DecodeError& refusal,
                                                std::size_t& calls) {
  auto hook = [&]() -> std::expected<void, DecodeError> {
    if (calls++ == refused) return std::unexpected(refusal);
    return {};
  };
  BinaryDecoder decoder(std::as_bytes(std::span(bytes)), hook);
  return message.decode(decoder);
}

bool nestsOneofs(const MessageDescriptor& type) {
  return std::ranges::any_of(type.fields, [](const FieldDescriptor& field) {
    return field.type == ValueType::message && field.message->holdsOneof();
  });
}

}  // namespace

std::string faultOfRefusing(const AnyMessage& type, std::string_view bytes) {
  if (!type.descriptor().holdsOneof()) return "";
  const DecodeError refusal{.cause = DecodeCause::conflictingOneOf, .length = 7, .offset = 123456};
  // What is there, and how often the hook was asked, after each of the outermost records.
  std::vector<std::pair<std::size_t, MessagePointer>> states;
  states.emplace_back(0, type.copied());
  for (const std::size_t end : recordEnds(bytes)) {
    MessagePointer message = type.copied();
    std::size_t calls = 0;
    if (!decodeRefusing(*message, bytes.substr(0, end), SIZE_MAX, refusal, calls)) break;
    states.emplace_back(calls, std::move(message));
  }
  const std::size_t mostCalls = std::min<std::size_t>(states.back().first, 8);
  for (std::size_t refused = 0; refused < mostCalls; ++refused) {
    const MessagePointer message = type.copied();
    std::size_t calls = 0;
    const auto result = decodeRefusing(*message, bytes, refused, refusal, calls);
    if (result != std::unexpected(refusal)) return "the hook's error is not the result";
    if (calls != refused + 1) return "the hook is asked again after it refused";
    if (nestsOneofs(type.descriptor())) {
      // Of a message that is merged, what came before the refusal stays.
      if (std::string fault = faultOfEncoding(*message); !fault.empty()) return "after a refusal " + fault;
      continue;
    }
    const auto after = std::ranges::find_if(states, [&](const auto& state) { return state.first > refused; });
    if (!(*message == *std::prev(after)->second)) return "a refused record leaves something behind";
  }
  return "";
}

namespace {

std::uint64_t hashOf(const auto& value) {
  Hasher hasher;
  value.hash(hasher);
  return hasher.finish();
}

// The text in every place that a group has for one.
Group groupWith(const Text& text) {
  Group group;
  Member member;
  member.setHandle(text);
  member.setTokenID(text);
  group.mutableInitialize().setMembers({member, Member(), member});
  return group;
}

}  // namespace

std::string faultOfComparing(const std::array<std::string_view, 3>& texts) {
  struct Row {
    Text text;
    std::string form;
    Group group;
  };
  std::vector<Row> rows;
  for (const std::string_view bytes : texts) {
    const Text text = bytes;
    if (Text::checked(bytes).has_value() != (text.utf8() == bytes)) return "checked texts are others";
    if (!Text::checked(text.utf8())) return "a text is ill-formed";
    rows.push_back({text, slowDecomposition(text.utf8()), groupWith(text)});
    rows.push_back({rows.back().form, rows.back().form, groupWith(rows.back().form)});
  }
  // Equality by the decompositions is reflexive, symmetric and transitive; so is what agrees with it.
  for (const Row& left : rows) {
    for (const Row& right : rows) {
      const bool areEqual = left.form == right.form;
      if ((left.text == right.text) != areEqual) return "texts are compared otherwise";
      if ((hashOf(left.text) == hashOf(right.text)) != areEqual) return "texts are hashed otherwise";
      if ((left.group == right.group) != areEqual) return "messages are compared unlike their texts";
      if ((left.group.hashValue() == right.group.hashValue()) != areEqual)
        return "messages are hashed unlike their texts";
    }
  }
  return "";
}

namespace {

// The messages that lie in a stream whose lengths are well-formed; none where it breaks off.
std::vector<std::optional<std::string_view>> messagesIn(std::string_view stream) {
  std::vector<std::optional<std::string_view>> messages;
  while (!stream.empty()) {
    std::uint64_t size = 0;
    std::size_t length = 0;
    while (length < 5 && length < stream.size()) {
      const auto byte = static_cast<unsigned char>(stream[length]);
      size |= std::uint64_t{byte & 0x7FU} << 7 * length++;
      if (byte < 0x80) break;
    }
    const bool isWhole = static_cast<signed char>(stream[length - 1]) >= 0;
    if (!isWhole || size > stream.size() - length || size >= std::uint64_t{1} << 31) {
      messages.emplace_back();
      break;
    }
    messages.emplace_back(stream.substr(length, static_cast<std::size_t>(size)));
    stream.remove_prefix(length + messages.back()->size());
  }
  return messages;
}

// Reads a stream in pieces of these sizes, over and over; 0 stands for the rest.
DelimitedReader readerInPieces(std::string_view stream, std::string_view pieces) {
  return DelimitedReader([stream, pieces, at = std::size_t{0}](std::span<std::byte> room) mutable {
    std::size_t count = std::min(stream.size(), room.size());
    if (!pieces.empty()) {
      const auto piece = static_cast<unsigned char>(pieces[at++ % pieces.size()]);
      if (piece != 0) count = std::min<std::size_t>(count, piece);
    }
    std::ranges::copy(std::as_bytes(std::span(stream.substr(0, count))), room.begin());
    stream.remove_prefix(count);
    return static_cast<std::ptrdiff_t>(count);
  });
}

}  // namespace

std::string faultOfStream(std::string_view stream, std::string_view pieces) {
  DelimitedReader whole = readerInPieces(stream, "");
  DelimitedReader cut = readerInPieces(stream, pieces);
  for (const auto& message : messagesIn(stream)) {
    const auto fromWhole = whole.next();
    const auto fromCut = cut.next();
    if (fromWhole.has_value() != fromCut.has_value()) return "pieces change the verdict";
    if (fromWhole.has_value() != message.has_value()) return "the stream is divided otherwise";
    if (!fromCut) {
      if (fromCut.error() != fromWhole.error()) return "pieces change the error";
      const auto again = cut.next();
      if (again.has_value() || again.error() != fromCut.error()) return "the error is forgotten";
      return "";
    }
    if (!*fromCut || !std::ranges::equal(**fromCut, std::as_bytes(std::span(*message))))
      return "another message comes";
    if (whole.messageOffset() != cut.messageOffset()) return "pieces move the message";
  }
  const auto atEnd = cut.next();
  if (!atEnd || *atEnd) return "the end is not seen";
  return "";
}

}  // namespace orv::test
