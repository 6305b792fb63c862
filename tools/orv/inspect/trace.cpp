#include "tools/orv/inspect/trace.hpp"

#include <cassert>
#include <charconv>
#include <string>
#include <vector>

#include <orv/byte_view.hpp>
#include <orv/utf8.hpp>
#include "tools/orv/messages/message_value.hpp"

namespace orv::tool {

namespace {

// Why tracing ended. What is malformed, parsing can tell better.
enum class End : std::uint8_t { ofInput, malformed, stopped };

void appendNumber(std::uint64_t number, std::string& output) {
  char digits[20];
  output.append(digits, std::to_chars(digits, digits + sizeof digits, number).ptr);
}

constexpr WireType wireTypeOf(ValueType type) {
  switch (type) {
    case ValueType::boolean:
    case ValueType::uint32:
    case ValueType::enumeration: return WireType::varint;
    case ValueType::string:
    case ValueType::bytes:
    case ValueType::message: break;
  }
  return WireType::lengthDelimited;
}

class Tracer {
 public:
  explicit Tracer(TraceSink& sink) : sink_(sink) {}

  // `nesting` is how many messages the bytes are already in.
  End traceMessage(const MessageDescriptor& message, std::span<const std::byte> bytes, int nesting) {
    WireReader reader(bytes);
    const std::size_t pathSize = path_.size();
    std::vector<std::size_t> occurrences;  // of repeated fields, by the field's place in the message
    while (!reader.isAtEnd()) {
      const std::byte* const start = reader.position();
      const auto tag = reader.readTag();
      if (!tag) return End::malformed;
      const FieldDescriptor* const field = message.field(tag->fieldNumber());
      const bool isTaken = field != nullptr && tag->wireType() == wireTypeOf(field->type);
      TracedRecord record{
          .type = {}, .field = field, .tag = *tag, .path = {}, .header = {}, .value = {}, .number = 0};
      if (isTaken) record.type = field->type;
      if (!readValue(reader, start, nesting, record)) return End::malformed;
      record.header = {start, record.value.data()};

      path_.resize(pathSize);
      if (pathSize != 0) path_ += '.';
      if (field != nullptr) {
        path_ += field->name;
      } else {
        appendNumber(tag->fieldNumber(), path_);
      }
      if (isTaken && field->kind == FieldKind::repeated) {
        occurrences.resize(message.fields.size());
        path_ += '[';
        appendNumber(occurrences[static_cast<std::size_t>(field - message.fields.data())]++, path_);
        path_ += ']';
      }
      record.path = path_;
      if (!sink_.record(record)) return End::stopped;
      if (record.type != ValueType::message) continue;
      if (const End end = traceMessage(*field->message, record.value, nesting + 1); end != End::ofInput)
        return end;
    }
    path_.resize(pathSize);
    return End::ofInput;
  }

 private:
  // Reads what stands behind the record's tag, into the record. False for what is malformed.
  static bool readValue(WireReader& reader, const std::byte* start, int nesting, TracedRecord& record) {
    const std::byte* const valueStart = reader.position();
    WireReader again = reader;
    if (!reader.skipValue(record.tag, start, nesting)) return false;
    record.value = {valueStart, reader.position()};
    switch (record.tag.wireType()) {
      case WireType::varint: record.number = *again.readVarint(); break;
      case WireType::fixed32: record.number = *again.readFixed32(); break;
      case WireType::fixed64: record.number = *again.readFixed64(); break;
      case WireType::lengthDelimited: record.value = *again.readLengthDelimited(); break;
      case WireType::startGroup:
      case WireType::endGroup: break;
    }
    return record.type != ValueType::string || utf8::isWellFormed(charactersOf(record.value));
  }

  TraceSink& sink_;
  std::string path_;  // of the message or field that is being read
};

}  // namespace

std::expected<bool, DecodeError> trace(const MessageType& type, std::span<const std::byte> bytes,
                                       TraceSink& sink) {
  const End end = Tracer(sink).traceMessage(*type.descriptor, bytes, 0);
  if (end != End::malformed) return end == End::ofInput;
  const auto parsed = parseMessage(type, bytes, PayloadPairing::closed());
  assert(!parsed);
  return std::unexpected(parsed.error());
}

}  // namespace orv::tool
