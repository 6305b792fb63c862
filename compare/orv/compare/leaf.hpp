// A message taken apart, to find where two messages differ.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <variant>
#include <vector>

#include <orv/any_value_visitor.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/compare/alignment.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>

namespace orv::inline v0::compare {

// As places name them.
inline constexpr std::string_view unknownFieldsName = "unknownFields";

// A field on the way from the outermost message to a value. Unknown fields come last, as one field that is a
// list.
struct Step {
  static constexpr std::uint32_t unknownFields = 0xFFFFFFFF;

  std::uint32_t number;
  std::optional<std::size_t> index;  // in a list
  std::string_view name;

  friend auto operator<=>(const Step& left, const Step& right) {
    return std::tie(left.number, left.index) <=> std::tie(right.number, right.index);
  }
  friend bool operator==(const Step& left, const Step& right) { return (left <=> right) == 0; }
};

// A present message of this type, whatever it holds.
struct MessagePresence {
  std::string_view type;

  friend bool operator==(MessagePresence, MessagePresence) = default;
};

// An enumeration's value, with its name if it has one.
struct EnumerationValue {
  std::int64_t rawValue;
  std::string_view name;

  friend bool operator==(const EnumerationValue&, const EnumerationValue&) = default;
};

// A kept record, as it came.
struct UnknownRecord {
  std::string bytes;

  friend bool operator==(const UnknownRecord&, const UnknownRecord&) = default;
};

// One value of a message tree and its place. Values are equal as the model has it: texts when they are
// canonically equivalent.
struct Leaf {
  std::vector<Step> place;
  std::variant<MessagePresence, Text, ByteBuffer, bool, std::uint32_t, EnumerationValue, UnknownRecord> value;

  // "data.initialize.members[1].handle"
  std::string path() const;
  // Whether a path leads here, or to a message that this is in. One without an index stands for all items.
  bool isAt(std::string_view path) const;
  bool isIn(const Leaf& message) const;
};

// Of leaves that are one message, or one item of a list whose place has `depth` steps. Equal ones have equal contents;
// those of the same fields and kinds have the same shape.
AlignmentKey keyOf(std::span<const Leaf> leaves, std::size_t depth = 0);

// What a value holds, on a line that is cut where it is long: `{handle: "ann"}`. The first leaf is the value, the
// others are in it.
std::string summaryOf(std::span<const Leaf> value);

// A visitor that lists the leaves of what it walks, in ascending order of their places; a message stands
// before what is in it.
class LeafCollector : public AnyValueVisitor<LeafCollector> {
 public:
  template <class M>
  static std::vector<Leaf> collect(const M& message) {
    LeafCollector collector;
    (void)message.traverse(collector);
    return std::move(collector.leaves_);
  }

  template <class T>
  Result visitAnyValue(const T& value, std::uint32_t number) {
    return add(number, value);
  }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue());
    return add(number, EnumerationValue{value.rawValue(), name.value_or(std::string_view())});
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    enter(number, MessagePresence{M::protoMessageName});
    (void)walkNested(message);
    place_.pop_back();
    return {};
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    return visitItems(texts, [&](const Text& text) { return visitAnyValue(text, number); });
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    return visitItems(messages, [&](const M& message) { return visitSingularMessageField(message, number); });
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  template <class Items, class Visit>
  Result visitItems(const Items& items, Visit visit) {
    std::size_t index = 0;
    for (const auto& item : items) {
      itemIndex_ = index++;
      (void)visit(item);
    }
    return {};
  }

  // Adds a leaf, and stays at its place.
  template <class T>
  void enter(std::uint32_t number, T value) {
    // What has no name are the unknown fields.
    const FieldDescriptor* const named = field(number);
    const std::string_view name = named != nullptr ? named->name : unknownFieldsName;
    place_.push_back({number, std::exchange(itemIndex_, std::nullopt), name});
    leaves_.push_back({place_, std::move(value)});
  }
  template <class T>
  Result add(std::uint32_t number, T value) {
    enter(number, std::move(value));
    place_.pop_back();
    return {};
  }

  std::vector<Leaf> leaves_;
  std::vector<Step> place_;
  std::optional<std::size_t> itemIndex_;  // of the item that is visited next
};

}  // namespace orv::compare
