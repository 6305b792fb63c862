#include "tools/orv/inspect/trace.hpp"

#include <algorithm>
#include <array>
#include <cassert>
#include <string>

#include <orv/byte_view.hpp>
#include <orv/utf8.hpp>
#include "tools/orv/messages/message_value.hpp"

namespace orv::tool {

namespace {

// Why tracing ended. What is malformed, parsing can tell better.
enum class End : std::uint8_t { ofInput, malformed, stopped };

constexpr std::size_t mostFields = [] {
  std::size_t most = 0;
  AllMessages::forEach([&]<class M>() { most = std::max(most, M::descriptor().fields.size()); });
  return most;
}();

// What was read, if it was, into its place.
template <class T, class Place>
bool take(const WireResult<T>& read, Place& place) {
  if (read) place = *read;
  return read.has_value();
}

}  // namespace

class Tracer {
 public:
  Tracer(TraceSink& sink, AbsentFields absent) : sink_(sink), absent_(absent), path_(sink.path_) {}

  // Leaves the sink's path as it was.
  End trace(const MessageDescriptor& message, std::span<const std::byte> bytes) {
    const std::size_t pathSize = path_.size();
    const End end = traceMessage(message, bytes, 0);
    path_.resize(pathSize);
    return end;
  }

 private:
  // `nesting` is how many messages the bytes are already in.
  End traceMessage(const MessageDescriptor& message, std::span<const std::byte> bytes, int nesting) {
    WireReader reader(bytes);
    const std::size_t pathSize = path_.size();
    Occurrences occurrences{};
    while (!reader.isAtEnd()) {
      const std::byte* const start = reader.position();
      const auto tag = reader.readTag();
      if (!tag) return End::malformed;
      const FieldDescriptor* const field = message.field(tag->fieldNumber());
      const bool isTaken = field != nullptr && tag->wireType() == wireTypeOf(field->type);
      TracedRecord record{.type = {},
                          .field = field,
                          .tag = *tag,
                          .path = {},
                          .header = {},
                          .value = {},
                          .number = 0,
                          .level = static_cast<std::size_t>(nesting)};
      if (isTaken) record.type = field->type;
      if (!readValue(reader, start, nesting, record)) return End::malformed;
      record.header = {start, record.value.data()};

      enterField(pathSize, field, tag->fieldNumber());
      if (isTaken) {
        const std::uint32_t index = occurrences[static_cast<std::size_t>(field - message.fields.data())]++;
        if (field->kind == FieldKind::repeated) {
          path_.append("[").append(std::to_string(index)) += ']';
        }
      }
      record.path = path_;
      if (!sink_.record(record)) return End::stopped;
      if (record.type != ValueType::message) continue;
      if (const End end = traceMessage(*field->message, record.value, nesting + 1); end != End::ofInput)
        return end;
    }
    path_.resize(pathSize);
    const End end =
        absent_ == AbsentFields::tell ? tellAbsent(message, reader, nesting, occurrences) : End::ofInput;
    path_.resize(pathSize);
    return end;
  }

  // How often each field was there, by its place in its message.
  using Occurrences = std::array<std::uint32_t, mostFields>;

  void enterField(std::size_t pathSize, const FieldDescriptor* field, std::uint32_t number) {
    path_.resize(pathSize);
    if (pathSize != 0) path_ += '.';
    if (field != nullptr) {
      path_ += field->name;
    } else {
      path_ += std::to_string(number);
    }
  }

  End tellAbsent(const MessageDescriptor& message, const WireReader& reader, int nesting,
                 const Occurrences& occurrences) {
    const std::size_t pathSize = path_.size();
    const std::span<const std::byte> none(reader.position(), 0);
    for (std::size_t at = 0; at < message.fields.size(); ++at) {
      if (occurrences[at] != 0) continue;
      const FieldDescriptor& field = message.fields[at];
      enterField(pathSize, &field, field.number);
      if (!sink_.record({.type = field.type,
                         .field = &field,
                         .tag = {},
                         .path = path_,
                         .header = none,
                         .value = none,
                         .number = 0,
                         .level = static_cast<std::size_t>(nesting)}))
        return End::stopped;
    }
    return End::ofInput;
  }

  // Reads what stands behind the record's tag, into the record. False for what is malformed.
  static bool readValue(WireReader& reader, const std::byte* start, int nesting, TracedRecord& record) {
    const std::byte* const valueStart = reader.position();
    bool isRead = false;
    switch (record.tag.wireType()) {
      case WireType::lengthDelimited:
        return take(reader.readLengthDelimited(), record.value) &&
               (record.type != ValueType::string || utf8::isWellFormed(charactersOf(record.value)));
      case WireType::varint: isRead = take(reader.readVarint(), record.number); break;
      case WireType::fixed32: isRead = take(reader.readFixed32(), record.number); break;
      case WireType::fixed64: isRead = take(reader.readFixed64(), record.number); break;
      default: isRead = reader.skipValue(record.tag, start, nesting).has_value();
    }
    record.value = {valueStart, reader.position()};
    return isRead;
  }

  TraceSink& sink_;
  AbsentFields absent_;
  std::string& path_;
};

std::expected<bool, DecodeError> trace(const MessageType& type, std::span<const std::byte> bytes,
                                       TraceSink& sink, AbsentFields absent) {
  const End end = Tracer(sink, absent).trace(*type.descriptor, bytes);
  if (end != End::malformed) return end == End::ofInput;
  const auto parsed = parseMessage(type, bytes, PayloadPairing::closed());
  assert(!parsed);
  return std::unexpected(parsed.error());
}

}  // namespace orv::tool
