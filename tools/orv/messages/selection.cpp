#include "tools/orv/messages/selection.hpp"

#include <algorithm>
#include <charconv>

#include <orv/spelling/hex.hpp>
#include <orv/spelling/value_text.hpp>

namespace orv::tool {

namespace {

// Whether a leaf's value is the one that is spelled, as the text format, or hexadecimal digits, spell it.
struct IsValue {
  const std::string& spelled;

  bool operator()(compare::MessagePresence) const { return false; }
  bool operator()(const Text& text) const { return text == Text(spelled); }
  bool operator()(const ByteBuffer& bytes) const {
    std::string digits;
    spelling::appendHex(bytes.characters(), digits);
    return spelled == bytes.characters() || spelled == digits;
  }
  bool operator()(bool flag) const { return spelled == (flag ? "true" : "false"); }
  bool operator()(std::uint32_t number) const { return spelled == std::to_string(number); }
  bool operator()(const compare::EnumerationValue& value) const {
    return spelled == value.name || spelled == std::to_string(value.rawValue);
  }
  bool operator()(const compare::UnknownRecord&) const { return false; }
};

}  // namespace

bool leadsToField(std::string_view path, const MessageDescriptor& type) {
  const std::string_view name = path.substr(0, path.find_first_of(".["));
  const auto field = std::ranges::find(type.fields, name, &FieldDescriptor::name);
  if (field == type.fields.end()) return name == compare::unknownFieldsName;
  const auto dot = path.find('.');
  if (dot == std::string_view::npos) return true;
  const std::string_view rest = path.substr(dot + 1);
  if (field->message != nullptr) return leadsToField(rest, *field->message);
  return typeOf(type).isEnvelope() && name == "data" &&
         std::ranges::any_of(allMessageTypes(), [&](const MessageType& payload) {
           return leadsToField(rest, *payload.descriptor);
         });
}

std::expected<void, std::string> Selection::addNumbers(std::string_view range) {
  const char* const end = range.data() + range.size();
  auto read = std::from_chars(end - range.size(), end, first_);
  const bool isOpen = read.ptr != end && *read.ptr == '-';
  last_ = first_;
  if (isOpen && read.ptr + 1 == end) {
    last_ = everything;
    ++read.ptr;
  } else if (isOpen && read.ec == std::errc()) {
    read = std::from_chars(read.ptr + 1, end, last_);
  }
  if (read.ec == std::errc() && read.ptr == end && first_ != 0 && first_ <= last_) return {};
  return std::unexpected(spelling::quotedText(range) + " is no range of messages (6, 3-8, 3-)");
}

void Selection::addCondition(std::string_view condition) {
  Condition added{.given = std::string(condition), .path = std::string(condition), .value = std::nullopt};
  const auto equals = condition.find('=');
  if (equals != std::string_view::npos) {
    added.path.resize(equals);
    added.value = condition.substr(equals + 1);
  } else if (kindNumber(condition)) {
    added.path = "type";
    added.value = condition;
  }
  conditions_.push_back(std::move(added));
}

const std::string* Selection::unmeetable(const MessageType& type) const {
  const auto found = std::ranges::find_if_not(conditions_, [&](const Condition& condition) {
    return leadsToField(condition.path, *type.descriptor);
  });
  return found == conditions_.end() ? nullptr : &found->given;
}

bool Selection::takes(const MessageValue& message) const {
  if (conditions_.empty()) return true;
  const auto leaves = message.leaves();
  const auto isMet = [&](const Condition& condition) {
    return std::ranges::any_of(leaves, [&](const compare::Leaf& leaf) {
      return leaf.isAt(condition.path) &&
             (!condition.value || std::visit(IsValue{*condition.value}, leaf.value));
    });
  };
  return std::ranges::all_of(conditions_, [&](const Condition& condition) {
    return std::ranges::any_of(conditions_, [&](const Condition& alternative) {
      return alternative.path == condition.path && isMet(alternative);
    });
  });
}

}  // namespace orv::tool
