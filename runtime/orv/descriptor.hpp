// What is known of a message type without a value of it.
#pragma once

#include <algorithm>
#include <cstdint>
#include <span>
#include <string_view>

namespace orv {

struct MessageDescriptor;

struct FieldDescriptor {
  std::uint32_t number;
  std::string_view name;
  const MessageDescriptor* message;  // the type of a nested message; none for other fields
  bool isRepeated;
  bool holdsOneof;  // is a member of a oneof, or its message has one
};

// One constant per message type; all that it refers to lasts as long as the program.
struct MessageDescriptor {
  std::string_view fullName;
  std::span<const FieldDescriptor> fields;  // in ascending order of their numbers

  // Whether the message, or one nested in it, has a oneof.
  constexpr bool holdsOneof() const { return std::ranges::any_of(fields, &FieldDescriptor::holdsOneof); }

  // None for a number that the message does not define.
  constexpr const FieldDescriptor* field(std::uint32_t number) const {
    for (const FieldDescriptor& candidate : fields) {
      if (candidate.number == number) return &candidate;
    }
    return nullptr;
  }
};

}  // namespace orv
