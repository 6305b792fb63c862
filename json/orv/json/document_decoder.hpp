// Reads messages from a JSON document.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/json/document.hpp>
#include <orv/json/error.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>

namespace orv::json {

// A decoder over one JSON object: its members are the fields, found by their text names. A member that is
// null counts as absent. It reads strictly: what the message does not define, or cannot hold, is an error
// with its path.
class DocumentDecoder {
 public:
  using Error = json::Error;
  using Result = std::expected<void, Error>;

  explicit DocumentDecoder(Value object) : object_(object) {}

  // The operations that Decoder lists.

  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M&) {
    return nextNumber(M::_protobuf_nameMap());
  }

  Result decodeSingularStringField(Text& value) { return take(value, &DocumentDecoder::readText); }
  Result decodeSingularStringField(std::optional<Text>& value) {
    return take(value, &DocumentDecoder::readText);
  }
  Result decodeSingularBytesField(ByteBuffer& value) { return take(value, &DocumentDecoder::readBytes); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>& value) {
    return take(value, &DocumentDecoder::readBytes);
  }
  Result decodeSingularBoolField(bool& value) { return take(value, &DocumentDecoder::readBool); }
  Result decodeSingularBoolField(std::optional<bool>& value) {
    return take(value, &DocumentDecoder::readBool);
  }
  // A number without a fraction, or a string of digits.
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>& value) {
    return take(value, &DocumentDecoder::readUInt32);
  }
  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    makeRoom(texts);
    return forEachItem([&]() -> Result {
      Text text;
      if (auto taken = take(text, &DocumentDecoder::readText); !taken) return taken;
      texts.push_back(std::move(text));
      return {};
    });
  }

  // By name or by number.
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>& value) {
    const auto rawValue = readEnum(Enumeration::_protobuf_nameMap());
    if (!rawValue) return std::unexpected(rawValue.error());
    value = Enumeration(*rawValue);
    return {};
  }

  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    M message = slot.value_or(M());
    if (auto result = readMessage(message); !result) return result;
    slot = std::move(message);
    return {};
  }

  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    makeRoom(messages);
    return forEachItem([&]() -> Result {
      M message;
      if (auto result = readMessage(message); !result) return result;
      messages.push_back(std::move(message));
      return {};
    });
  }

  Result handleConflictingOneOf() const { return fail("a second member of a oneof"); }

 private:
  DocumentDecoder(Value object, const DocumentDecoder& outer) : object_(object), outer_(&outer) {}

  template <class M>
  Result readMessage(M& message) const {
    DocumentDecoder nested(*value_, *this);
    return message.decodeMessage(nested);
  }

  // Into a value or an optional one.
  template <class Slot, class T>
  Result take(Slot& slot, std::expected<T, Error> (DocumentDecoder::*read)() const) {
    auto value = (this->*read)();
    if (!value) return std::unexpected(std::move(value.error()));
    slot = std::move(*value);
    return {};
  }

  // Reads the items of the member, a list, one after the other.
  template <class ReadItem>
  Result forEachItem(ReadItem readItem) {
    const Value list = *value_;
    if (list.kind() != Value::Kind::list) return failExpecting("a list");
    const std::size_t size = list.size();
    for (std::size_t index = 0; index < size; ++index) {
      value_ = list.item(index);
      itemIndex_ = index;
      if (auto result = readItem(); !result) return result;
    }
    itemIndex_.reset();
    return {};
  }

  template <class T>
  void makeRoom(std::vector<T>& list) const {
    if (value_->kind() == Value::Kind::list) list.reserve(list.size() + value_->size());
  }

  std::expected<std::optional<std::uint32_t>, Error> nextNumber(NameMap names);
  std::expected<Text, Error> readText() const;
  std::expected<ByteBuffer, Error> readBytes() const;
  std::expected<bool, Error> readBool() const;
  std::expected<std::uint32_t, Error> readUInt32() const;
  std::expected<std::int64_t, Error> readEnum(NameMap names) const;

  // Where the member stands whose value is being read.
  std::string path() const;
  std::unexpected<Error> fail(std::string reason) const;
  std::unexpected<Error> failExpecting(std::string_view expected) const;

  Value object_;
  const DocumentDecoder* outer_ = nullptr;  // who reads the enclosing message
  std::size_t nextMember_ = 0;
  std::string_view name_;       // of the member that is being read
  std::optional<Value> value_;  // its value, or that of one item
  std::optional<std::size_t> itemIndex_;
};

}  // namespace orv::json
