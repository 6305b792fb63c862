// Which messages of the input are taken.
#pragma once

#include <cstdint>
#include <expected>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tools/orv/messages/message_type.hpp"
#include "tools/orv/messages/message_value.hpp"

namespace orv::tool {

// Whether the path leads to a field, or to the unknown ones. What stands in an envelope's data can be of any type.
bool leadsToField(std::string_view path, const MessageDescriptor& type);

// Messages by their numbers and by what they hold; all of them, unless it is said otherwise.
class Selection {
 public:
  // "6", "3-8" or "3-". The error says what is wrong with it.
  std::expected<void, std::string> addNumbers(std::string_view range);
  // A kind of envelopes, "FIELD" for what has this field, or "FIELD=VALUE" for what has the value in it, or in a
  // field of the message that it is. Conditions on one field are alternatives; fields must all be as they are said.
  void addCondition(std::string_view condition);
  // The condition that no message of this type can meet, if there is one.
  const std::string* unmeetable(const MessageType& type) const;

  bool hasNumbers() const { return first_ != 1 || last_ != everything; }
  bool hasConditions() const { return !conditions_.empty(); }

  // Of messages from 1 on; 0 stands for input that is one message.
  bool takesNumber(std::uint64_t number) const {
    return number == 0 || (first_ <= number && number <= last_);
  }
  bool isLast(std::uint64_t number) const { return number == last_; }
  bool takes(const MessageValue& message) const;

 private:
  static constexpr std::uint64_t everything = std::numeric_limits<std::uint64_t>::max();

  struct Condition {
    std::string given;
    std::string path;
    std::optional<std::string> value;  // none where presence will do
  };

  std::uint64_t first_ = 1;
  std::uint64_t last_ = everything;
  std::vector<Condition> conditions_;
};

}  // namespace orv::tool
