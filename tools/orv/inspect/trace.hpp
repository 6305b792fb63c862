// Follows a message's decoding record by record.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include <orv/decode_error.hpp>
#include <orv/wire_reader.hpp>
#include "tools/orv/messages/message_type.hpp"

namespace orv::tool {

// One record of the wire, as the message's decoding takes it; or a field that has none, where its message ends.
struct TracedRecord {
  // What the field that takes the record holds; none for a record that is kept as unknown.
  std::optional<ValueType> type;
  // The field of this number, if the message defines one: also of an unknown record, whose wire type does not
  // fit then.
  const FieldDescriptor* field;
  Tag tag;
  // From the outermost message: "initialize.members[1].handle". A number without a name stands for itself.
  std::string_view path;
  std::span<const std::byte> header;  // the tag, and the length if there is one
  std::span<const std::byte> value;   // what is behind it; for a message, its records follow on their own
  std::uint64_t number;               // of a varint or a fixed-size number
  std::size_t level;                  // how many messages it is in, beside the outermost

  // A field without a record: without a tag, and all its bytes are none, at the end of its message.
  bool isAbsent() const { return tag.value == 0; }

  // Of the enumeration's case; empty for a number without a name.
  std::string_view caseName() const {
    return field->cases.name(static_cast<std::int32_t>(number)).value_or(std::string_view());
  }
};

// Receives the records.
class TraceSink {
 public:
  // False ends the tracing. What a record's bytes are can be traced into the sink as well, whose paths then go on
  // from the record's.
  virtual bool record(const TracedRecord& record) = 0;

 protected:
  ~TraceSink() = default;

 private:
  friend class Tracer;
  std::string path_;  // of the message or field that is being read
};

// Reads the bytes as a message of the type, by its descriptor. Answers whether the sink saw them to their end;
// the error of malformed bytes is the one that parsing them gives, and the records before it were handed out.
// Nothing of the message is kept, so memory does not grow with the input. Fields without a record are told on demand.
enum class AbsentFields : bool { leaveOut, tell };
std::expected<bool, DecodeError> trace(const MessageType& type, std::span<const std::byte> bytes,
                                       TraceSink& sink, AbsentFields absent = AbsentFields::leaveOut);

}  // namespace orv::tool
