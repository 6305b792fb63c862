#include <orv/json/document_decoder.hpp>

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/spelling/base64.hpp>
#include <orv/spelling/nearest_name.hpp>
#include <orv/wire_reader.hpp>

#include "wire_type_names.hpp"

namespace orv::inline v0::json {

namespace {

// A string in a message, cut short where it is long.
std::string quoted(std::string_view text) {
  constexpr std::size_t longest = 40;
  if (text.size() <= longest) return "\"" + std::string(text) + "\"";
  return "a string of " + std::to_string(text.size()) + " bytes";
}

void appendVarint(std::uint64_t value, std::string& output) {
  for (; value >= 0x80; value >>= 7) output += static_cast<char>(value | 0x80);
  output += static_cast<char>(value);
}

// A number from 0 on, or a string of its digits.
std::optional<std::uint64_t> numberOf(std::optional<Value> value) {
  if (!value) return std::nullopt;
  if (value->kind() == Value::Kind::number) {
    const auto number = value->integer();
    if (number && *number >= 0) return static_cast<std::uint64_t>(*number);
    return std::nullopt;
  }
  if (value->kind() != Value::Kind::text) return std::nullopt;
  const std::string_view digits = value->text();
  std::uint64_t number = 0;
  const auto [end, status] = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (status == std::errc() && end == digits.data() + digits.size()) return number;
  return std::nullopt;
}

std::optional<std::string> bytesOfBase64(std::optional<Value> value) {
  if (value && value->kind() == Value::Kind::text) return spelling::decodeBase64(value->text());
  return std::nullopt;
}

// Appends the bytes of an unknown field that is shown so. Answers what is wrong with it, if anything is.
std::optional<std::string> appendRecord(Value shown, std::string& output) {
  constexpr std::uint64_t highestNumber = (1U << 29) - 1;
  if (shown.kind() != Value::Kind::object)
    return "expected an object, found " + std::string(shown.kindName());
  for (std::size_t index = 0; index < shown.size(); ++index) {
    constexpr std::array<std::string_view, 4> names{"number", "wireType", "value", "record"};
    if (const auto name = shown.member(index).name; std::ranges::find(names, name) == names.end())
      return "an unknown field has no " + quoted(name);
  }
  if (const auto record = shown.find("record")) {
    const auto bytes = bytesOfBase64(record);
    if (bytes) output += *bytes;
    return bytes ? std::nullopt : std::optional<std::string>("\"record\" is no base64");
  }
  const auto number = numberOf(shown.find("number"));
  if (!number || *number == 0 || *number > highestNumber) return "\"number\" is no number of a field";
  const auto named = shown.find("wireType");
  const auto* const name = named && named->kind() == Value::Kind::text
                               ? std::ranges::find(wireTypeNames, named->text())
                               : wireTypeNames.end();
  const auto type = static_cast<WireType>(name - wireTypeNames.begin());
  const auto appendTag = [&](WireType wireType) {
    appendVarint(*number << 3 | static_cast<std::uint64_t>(wireType), output);
  };
  const auto appendFixed = [&](std::uint64_t bits, int size) {
    for (int index = 0; index < size; ++index) output += static_cast<char>(bits >> 8 * index);
  };
  const auto value = shown.find("value");
  const auto valueNumber = numberOf(value);
  appendTag(type);
  switch (type) {
    case WireType::varint:
      if (!valueNumber) return "\"value\" is no varint";
      appendVarint(*valueNumber, output);
      return std::nullopt;
    case WireType::fixed64:
    case WireType::fixed32:
      if (!valueNumber || (type == WireType::fixed32 && *valueNumber >> 32 != 0))
        return "\"value\" is out of range";
      appendFixed(*valueNumber, type == WireType::fixed64 ? 8 : 4);
      return std::nullopt;
    case WireType::lengthDelimited: {
      const auto bytes = bytesOfBase64(value);
      if (!bytes) return "\"value\" is no base64";
      appendVarint(bytes->size(), output);
      output += *bytes;
      return std::nullopt;
    }
    case WireType::startGroup:
      if (!value || value->kind() != Value::Kind::list) return "\"value\" is no list";
      for (std::size_t index = 0; index < value->size(); ++index) {
        if (auto mistake = appendRecord(value->item(index), output)) return mistake;
      }
      appendTag(WireType::endGroup);
      return std::nullopt;
    case WireType::endGroup: break;
  }
  return "\"wireType\" is none";
}

}  // namespace

std::expected<std::optional<std::uint32_t>, Error> DocumentDecoder::nextNumber(
    const MessageDescriptor& message, UnknownStorage& unknownFields) {
  if (object_.kind() != Value::Kind::object) {
    name_ = {};
    const std::string where = outer_ == nullptr ? "$" : outer_->path();
    return std::unexpected(
        Error{.reason = "expected an object, found " + std::string(object_.kindName()), .path = where});
  }
  const std::size_t size = object_.size();
  while (nextMember_ < size) {
    const Value::Member member = object_.member(nextMember_++);
    name_ = member.name;
    value_ = member.value;
    const auto field = std::ranges::find(message.fields, member.name, &FieldDescriptor::name);
    const bool isNull = member.value.kind() == Value::Kind::null;
    if (field != message.fields.end()) {
      if (!isNull) return field->number;
    } else if (member.name != "unknownFields") {
      return fail("unknown field" +
                  spelling::suggestion(member.name, message.fields, &FieldDescriptor::name));
    } else if (!isNull) {
      if (auto read = readUnknownFields(message, unknownFields); !read) return std::unexpected(read.error());
    }
  }
  return std::nullopt;
}

DocumentDecoder::Result DocumentDecoder::readUnknownFields(const MessageDescriptor& message,
                                                           UnknownStorage& unknownFields) {
  const Value list = *value_;
  if (list.kind() != Value::Kind::list) return failExpecting("a list");
  for (std::size_t index = 0; index < list.size(); ++index) {
    itemIndex_ = index;
    std::string bytes;
    if (const auto mistake = appendRecord(list.item(index), bytes)) return fail(*mistake);
    const auto records = UnknownStorage::checked(bytesOf(bytes));
    if (!records) return fail("malformed: " + records.error().reason());
    for (const UnknownField& record : *records) {
      // A known one would be read from the encoding, and nobody has looked at it here.
      const FieldDescriptor* const known = message.field(record.tag.fieldNumber());
      if (known != nullptr && wireTypeOf(known->type) == record.tag.wireType())
        return fail("field " + std::to_string(known->number) + " is " + std::string(known->name));
    }
    (void)unknownFields.append(bytesOf(bytes));  // they were just checked
  }
  itemIndex_.reset();
  return {};
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(Text& value) const {
  if (value_->kind() != Value::Kind::text) return failExpecting("a string");
  // The parser lets well-formed text through only.
  value = Text(value_->text());
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(ByteBuffer& value) const {
  if (value_->kind() != Value::Kind::text) return failExpecting("a base64 string");
  const auto bytes = spelling::decodeBase64(value_->text());
  if (!bytes) return fail("expected base64, found " + quoted(value_->text()));
  value = ByteBuffer(*bytes);
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(bool& value) const {
  if (value_->kind() != Value::Kind::boolean) return failExpecting("true or false");
  value = value_->boolean();
  return true;
}

std::expected<bool, Error> DocumentDecoder::readAnyValue(std::uint32_t& value) const {
  constexpr std::string_view expected = "a whole number from 0 to 4294967295";
  if (value_->kind() == Value::Kind::text) {
    const std::string_view digits = value_->text();
    const auto [end, status] = std::from_chars(digits.data(), digits.data() + digits.size(), value);
    if (status == std::errc() && end == digits.data() + digits.size()) return true;
    return fail("expected " + std::string(expected) + ", found " + quoted(digits));
  }
  if (value_->kind() != Value::Kind::number) return failExpecting(expected);
  const auto number = value_->integer();
  if (!number || !std::in_range<std::uint32_t>(*number))
    return fail("expected " + std::string(expected) + ", found another number");
  value = static_cast<std::uint32_t>(*number);
  return true;
}

std::expected<std::int64_t, Error> DocumentDecoder::readEnum(NameMap names) const {
  if (value_->kind() == Value::Kind::text) {
    if (const auto number = names.number(value_->text())) return *number;
    return fail("unknown name " + quoted(value_->text()) +
                spelling::suggestion(value_->text(), names.entries(), &NameMap::Entry::name));
  }
  if (value_->kind() != Value::Kind::number) return failExpecting("a name or a number");
  const auto number = value_->integer();
  // What is above would be cut on the wire.
  if (!number || !std::in_range<std::int32_t>(*number))
    return fail("expected a name or a whole number of 32 bits, found another number");
  return *number;
}

std::string DocumentDecoder::path() const {
  std::string path = (outer_ == nullptr ? "$" : outer_->path()) + memberStep(name_);
  if (itemIndex_.has_value()) path += '[' + std::to_string(*itemIndex_) + ']';
  return path;
}

std::unexpected<Error> DocumentDecoder::fail(std::string reason) const {
  return std::unexpected(Error{.reason = std::move(reason), .path = path()});
}

std::unexpected<Error> DocumentDecoder::failExpecting(std::string_view expected) const {
  return fail("expected " + std::string(expected) + ", found " + std::string(value_->kindName()));
}

}  // namespace orv::json
