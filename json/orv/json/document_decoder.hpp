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

#include <orv/any_value_decoder.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/descriptor.hpp>
#include <orv/json/document.hpp>
#include <orv/json/error.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>

namespace orv::inline v0::json {

// A decoder over one JSON object: its members are the fields, found by their text names. A member that is
// null counts as absent. It reads strictly: what the message does not define, or cannot hold, is an error
// with its path. Unknown fields stand in the member "unknownFields", as the renderer shows them.
class DocumentDecoder : public AnyValueDecoder<DocumentDecoder, Error> {
  using Base = AnyValueDecoder;

 public:
  using Base::Error;

  explicit DocumentDecoder(Value object) : object_(object) {}

  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M& message) {
    return nextNumber(M::descriptor(), message.mutableUnknownFields());
  }

  // Each answers true: what cannot be taken is an error.
  std::expected<bool, Error> readAnyValue(Text& value) const;
  std::expected<bool, Error> readAnyValue(ByteBuffer& value) const;
  std::expected<bool, Error> readAnyValue(bool& value) const;
  // A number without a fraction, or a string of digits.
  std::expected<bool, Error> readAnyValue(std::uint32_t& value) const;
  // By name or by number.
  template <class Enumeration>
  std::expected<bool, Error> readAnyValue(Enumeration& value) const {
    const auto rawValue = readEnum(Enumeration::_protobuf_nameMap());
    if (!rawValue) return std::unexpected(rawValue.error());
    value = Enumeration(*rawValue);
    return true;
  }
  template <class M>
  std::expected<bool, Error> readAnyMessage(M& message) const {
    DocumentDecoder nested(*value_, *this);
    if (auto read = message.decodeMessage(nested); !read) return std::unexpected(std::move(read.error()));
    return true;
  }

  Result decodeRepeatedStringField(std::vector<Text>& texts) {
    return forEachItem(texts, [&] { return Base::decodeRepeatedStringField(texts); });
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>& messages) {
    return forEachItem(messages, [&] { return Base::decodeRepeatedMessageField(messages); });
  }

  Result handleConflictingOneOf() const { return fail("a second member of a oneof"); }

 private:
  DocumentDecoder(Value object, const DocumentDecoder& outer) : object_(object), outer_(&outer) {}

  // Reads the items of the member, a list, one after the other.
  template <class T, class ReadItem>
  Result forEachItem(std::vector<T>& items, ReadItem readItem) {
    const Value list = *value_;
    if (list.kind() != Value::Kind::list) return failExpecting("a list");
    const std::size_t size = list.size();
    items.reserve(items.size() + size);
    for (std::size_t index = 0; index < size; ++index) {
      value_ = list.item(index);
      itemIndex_ = index;
      if (auto result = readItem(); !result) return result;
    }
    itemIndex_.reset();
    return {};
  }

  std::expected<std::optional<std::uint32_t>, Error> nextNumber(const MessageDescriptor& message,
                                                                UnknownStorage& unknownFields);
  // Reads the member, a list of what the renderer shows of unknown fields.
  Result readUnknownFields(const MessageDescriptor& message, UnknownStorage& unknownFields);
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
