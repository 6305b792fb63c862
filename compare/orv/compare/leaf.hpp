// A message taken apart, to find where two messages differ.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/enumeration.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::compare {

// A field on the way from the outermost message to a value. Unknown fields come last, as one field that is a
// list.
struct Step {
  static constexpr std::uint32_t unknownFields = 0xFFFFFFFF;

  std::uint32_t number;
  std::size_t index;  // in a list
  bool isInList;
  std::string_view name;

  friend std::strong_ordering operator<=>(const Step& left, const Step& right) {
    if (const auto order = left.number <=> right.number; order != 0) return order;
    return left.index <=> right.index;
  }
  friend bool operator==(const Step& left, const Step& right) { return (left <=> right) == 0; }
};

// A present message, whatever it holds.
struct MessagePresence {
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
  bool isIn(const Leaf& message) const;
};

// A visitor that lists the leaves of what it walks, in ascending order of their places; a message stands
// before what is in it.
class LeafCollector {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  template <class M>
  static std::vector<Leaf> collect(const M& message) {
    LeafCollector collector;
    collector.names_ = M::_protobuf_nameMap();
    (void)message.traverse(collector);
    return std::move(collector.leaves_);
  }

  // The operations that Visitor lists.

  Result visitSingularStringField(const Text& value, std::uint32_t number) { return add(number, value); }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) { return add(number, value); }
  Result visitSingularBoolField(bool value, std::uint32_t number) { return add(number, value); }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) { return add(number, value); }
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue());
    return add(number, EnumerationValue{value.rawValue(), name.value_or(std::string_view())});
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    return walk(message, stepTo(number));
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (std::size_t index = 0; index < texts.size(); ++index) addAt(stepTo(number, index), texts[index]);
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (std::size_t index = 0; index < messages.size(); ++index)
      (void)walk(messages[index], stepTo(number, index));
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  Step stepTo(std::uint32_t number) const {
    return {number, 0, false, names_.name(number).value_or(std::string_view())};
  }
  Step stepTo(std::uint32_t number, std::size_t index) const {
    return {number, index, true, names_.name(number).value_or(std::string_view())};
  }

  template <class T>
  void addAt(Step step, T value) {
    place_.push_back(step);
    leaves_.push_back({place_, std::move(value)});
    place_.pop_back();
  }
  template <class T>
  Result add(std::uint32_t number, T value) {
    addAt(stepTo(number), std::move(value));
    return {};
  }
  template <class M>
  Result walk(const M& message, Step step) {
    addAt(step, MessagePresence());
    place_.push_back(step);
    const NameMap outer = names_;
    names_ = M::_protobuf_nameMap();
    (void)message.traverse(*this);
    names_ = outer;
    place_.pop_back();
    return {};
  }

  std::vector<Leaf> leaves_;
  std::vector<Step> place_;
  NameMap names_;
};

}  // namespace orv::compare
