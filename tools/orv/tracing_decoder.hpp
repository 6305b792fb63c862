// The decoder that trace runs.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/descriptor.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>
#include "tools/orv/trace.hpp"

namespace orv::tool {

// Reads records as the binary decoder does and reports them. It hands no values to the message: a oneof group
// stays unset, so that no payload is ever copied.
class TracingDecoder {
 public:
  // Why it ends early. What is malformed the binary decoder can tell better.
  enum class Error : std::uint8_t { malformed, stopped };
  using Result = std::expected<void, Error>;

  TracingDecoder(std::span<const std::byte> bytes, TraceSink& sink) : reader_(bytes), sink_(sink) {}

  // The operations that Decoder lists.

  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M&) {
    message_ = &M::descriptor();
    return nextNumber();
  }

  Result decodeSingularStringField(Text&) { return traceText(false); }
  Result decodeSingularStringField(std::optional<Text>&) { return traceText(false); }
  Result decodeRepeatedStringField(std::vector<Text>&) { return traceText(true); }
  Result decodeSingularBytesField(ByteBuffer&) { return traceBytes(); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>&) { return traceBytes(); }
  Result decodeSingularBoolField(bool&) { return traceVarint(FieldUse::boolean, nullptr); }
  Result decodeSingularBoolField(std::optional<bool>&) { return traceVarint(FieldUse::boolean, nullptr); }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>&) {
    return traceVarint(FieldUse::uint32, nullptr);
  }
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>&) {
    constexpr NameMap names = Enumeration::_protobuf_nameMap();
    return traceVarint(FieldUse::enumeration, &names);
  }
  template <class M>
  Result decodeSingularMessageField(std::optional<M>&) {
    return traceMessage<M>(false);
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>&) {
    return traceMessage<M>(true);
  }
  Result handleConflictingOneOf() const { return {}; }

 private:
  TracingDecoder(std::span<const std::byte> bytes, const TracingDecoder& outer)
      : reader_(bytes), sink_(outer.sink_), nesting_(outer.nesting_ + 1), prefix_(outer.path_ + '.') {}

  template <class M>
  Result traceMessage(bool isRepeated) {
    if (tag_.wireType() != WireType::lengthDelimited) return {};
    const auto body = readBody();
    if (!body) return std::unexpected(body.error());
    setPath(isRepeated);
    if (auto done = report(FieldUse::message, *body, 0, M::protoMessageName); !done) return done;
    TracingDecoder nested(*body, *this);
    M message;
    return message.decodeMessage(nested);
  }

  std::expected<std::optional<std::uint32_t>, Error> nextNumber();
  Result traceText(bool isRepeated);
  Result traceBytes();
  Result traceVarint(FieldUse use, const NameMap* names);
  Result traceUnknown();

  std::expected<std::span<const std::byte>, Error> readBody();
  void setPath(bool isRepeated);
  Result report(FieldUse use, std::span<const std::byte> value, std::uint64_t number, std::string_view name);

  WireReader reader_;
  TraceSink& sink_;
  int nesting_ = 0;
  const MessageDescriptor* message_ = nullptr;
  const std::byte* recordStart_ = nullptr;
  const std::byte* valueStart_ =
      nullptr;  // of the field whose number was given last; nobody took it if it is next
  bool hasField_ = false;
  Tag tag_{0};
  std::string prefix_;                                // of the paths of this message's fields
  std::string path_;                                  // of the field that is being read
  std::map<std::uint32_t, std::size_t> occurrences_;  // of repeated fields
};

}  // namespace orv::tool
