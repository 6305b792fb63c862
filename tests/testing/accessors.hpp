// The accessors of all messages, as one table, and their effect beside that of the independent implementation.
#pragma once

#include <functional>
#include <span>
#include <string>
#include <string_view>

#include "tests/testing/any_message.hpp"

namespace orv::test {

// The accessors of a field, or of a oneof as a whole. Values are spelled as bytes: numbers as varints, messages by
// their encodings, lists as records of field 1, of a oneof the number of the member that is held, or 0. What a
// field does not offer is empty.
struct Accessors {
  std::string_view message;
  std::string_view field;
  std::function<std::string(AnyMessage&)> get;
  // Makes a value of any bytes, sets it, and answers how it is spelled. A oneof is set to that of a message that has
  // these bytes.
  std::function<std::string(AnyMessage&, std::string_view)> set;
  // As set, in place: texts, bytes, lists and messages are added to. A oneof is unset.
  std::function<std::string(AnyMessage&, std::string_view)> change;
  std::function<bool(AnyMessage&)> has;
  std::function<void(AnyMessage&)> clear;
};
std::span<const Accessors> allAccessors();

// Calls accessors of the message as the script's bytes say, in step with the independent implementation, and
// compares all that can be read after each step. Answers what differs.
std::string faultOfScript(const AnyMessage& type, std::string_view script);

}  // namespace orv::test
