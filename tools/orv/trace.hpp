// Follows a message's decoding record by record.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <span>
#include <string_view>

#include <orv/decode_error.hpp>
#include <orv/wire_reader.hpp>
#include "tools/orv/message_type.hpp"

namespace orv::tool {

// What the message made of a record: the operation that it read the field with, or none.
enum class FieldUse : std::uint8_t { string, bytes, boolean, uint32, enumeration, message, unknown };

// One record of the wire, as the message's own decodeMessage took it.
struct TracedRecord {
  FieldUse use;
  Tag tag;
  // From the outermost message: "initialize.members[1].handle". A number without a name stands for itself.
  std::string_view path;
  bool isDefined;  // also of an unknown field whose number is defined: its wire type does not fit
  std::span<const std::byte> header;  // the tag, and the length if there is one
  std::span<const std::byte> value;   // what is behind it; for a message, its records follow on their own
  std::uint64_t number = 0;           // of a varint or a fixed-size number
  std::string_view name = {};         // of a message's type, or of the enumeration's case
};

// Receives the records.
class TraceSink {
 public:
  // False ends the tracing.
  virtual bool record(const TracedRecord& record) = 0;

 protected:
  ~TraceSink() = default;
};

// Runs decodeMessage of a message of the type over the bytes. Answers whether the sink saw them to their end;
// the error of malformed bytes is the one that parsing them gives, and the records before it were handed out.
// Nothing of the message is kept, so memory does not grow with the input.
std::expected<bool, DecodeError> trace(const MessageType& type, std::span<const std::byte> bytes,
                                       TraceSink& sink);

}  // namespace orv::tool
