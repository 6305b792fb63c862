// What is known of a message type without a value of it.
#pragma once

#include <algorithm>
#include <cstdint>
#include <span>
#include <string_view>

#include <orv/name_map.hpp>

namespace orv::inline v0 {

// How a field is kept.
enum class FieldKind : std::uint8_t {
  implicitPresence,  // a plain value, left out when it is the default
  explicitPresence,  // absent, or a value
  singularMessage,   // absent, or a message
  repeated,          // a list
  oneofMember,       // one case of a oneof
};

// What a field's values are: each of its elements, for a list.
enum class ValueType : std::uint8_t { string, bytes, boolean, uint32, enumeration, message };

struct MessageDescriptor;

// What a message's table says of one field. It lasts as long as the program.
struct FieldDescriptor {
  std::uint32_t number;
  std::string_view name;
  FieldKind kind;
  ValueType type;
  std::uint8_t oneof;                // of a oneof member: which of the message's oneofs, counted from 0
  const MessageDescriptor* message;  // the type of a message; none for other values
  NameMap cases;                     // the named cases of an enumeration; empty for other values
  bool isSecret = false;             // whether its value is to be kept out of logs
};

// One constant per message type; all that it refers to lasts as long as the program.
struct MessageDescriptor {
  std::string_view fullName;
  std::span<const FieldDescriptor> fields;  // in ascending order of their numbers

  // Whether the message, or one nested in it, has a oneof.
  constexpr bool holdsOneof() const {
    return std::ranges::any_of(fields, [](const FieldDescriptor& field) {
      return field.kind == FieldKind::oneofMember ||
             (field.type == ValueType::message && field.message->holdsOneof());
    });
  }

  constexpr bool nestsMessages() const {
    return std::ranges::any_of(fields,
                               [](const FieldDescriptor& field) { return field.type == ValueType::message; });
  }

  // None for a number that the message does not define.
  constexpr const FieldDescriptor* field(std::uint32_t number) const {
    const auto found = std::ranges::find(fields, number, &FieldDescriptor::number);
    return found != fields.end() ? &*found : nullptr;
  }
};

}  // namespace orv
