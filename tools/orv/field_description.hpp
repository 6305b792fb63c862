// What the messages tell of their fields.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "tools/orv/message_type.hpp"

namespace orv::tool {

struct FieldDescription {
  std::uint32_t number;
  std::string_view name;
  std::string label;  // "optional", "repeated", "oneof 1"; empty for fields with implicit presence
  std::string type;   // "string", "enum", a message's name without the package
  std::string cases;  // of an enumeration
};

// The fields of a message type, found out by its name map and by handing it a field at a time to decode.
std::vector<FieldDescription> describeFields(const MessageType& type);

}  // namespace orv::tool
