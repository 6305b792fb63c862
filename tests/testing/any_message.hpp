// A message of any type, for what is tested of all types alike: the tests over them are compiled once, not
// once for each type.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <orv/binary_decoder.hpp>
#include <orv/decode_error.hpp>
#include <orv/descriptor.hpp>
#include <orv/encode_error.hpp>
#include <orv/name_map.hpp>
#include <orv/unknown_storage.hpp>
#include "tests/testing/scripted_decoder.hpp"
#include "tests/testing/tracing_visitor.hpp"

namespace orv::test {

class AnyMessage;
using MessagePointer = std::unique_ptr<AnyMessage>;

// Each operation is that of the message. An argument that is a message has the same type, unless it is
// compared with.
class AnyMessage {
 public:
  virtual ~AnyMessage() = default;

  virtual std::string_view fullName() const = 0;
  virtual NameMap nameMap() const = 0;
  virtual const MessageDescriptor& descriptor() const = 0;
  virtual bool isInitialized() const = 0;

  virtual MessagePointer copied() const = 0;
  virtual MessagePointer moved() = 0;
  virtual void assign(const AnyMessage& other) = 0;
  virtual void assignMoved(AnyMessage& other) = 0;

  virtual bool isEqualTo(const AnyMessage& other) const = 0;
  virtual std::weak_ordering order(const AnyMessage& other) const = 0;  // with one of the same type
  virtual std::uint64_t hashValue() const = 0;
  virtual std::string debugDescription() const = 0;
  virtual std::string printed() const = 0;
  virtual std::string redactedDescription() const = 0;
  virtual UnknownStorage& mutableUnknownFields() = 0;
  // Where the message is, for who knows its type.
  virtual void* address() = 0;

  // A new message.
  virtual std::expected<MessagePointer, DecodeError> parse(std::span<const std::byte> bytes) const = 0;
  virtual std::expected<void, DecodeError> merge(std::string_view bytes) = 0;
  virtual std::expected<void, DecodeError> reparse(std::string_view bytes) = 0;
  virtual std::expected<void, ScriptedError> decode(ScriptedDecoder& decoder) = 0;
  virtual std::expected<void, DecodeError> decode(BinaryDecoder& decoder) = 0;
  virtual TracingVisitor::Result traverse(TracingVisitor& visitor) const = 0;

  virtual std::expected<std::string, EncodeError> serialize() const = 0;
  virtual std::expected<std::size_t, EncodeError> serializeInto(std::span<std::byte> buffer) const = 0;
  virtual std::size_t encodedSize() const = 0;

  std::expected<MessagePointer, DecodeError> parse(std::string_view bytes) const {
    return parse(std::as_bytes(std::span(bytes)));
  }
  friend bool operator==(const AnyMessage& left, const AnyMessage& right) { return left.isEqualTo(right); }
};

// A default message of each type: of the list of all messages in its order, and of nested_messages.hpp.
const std::vector<MessagePointer>& allMessages();

// The one whose full name is this, or this behind "orv." or the like.
const AnyMessage& messageNamed(std::string_view name);

}  // namespace orv::test
