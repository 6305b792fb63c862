#include "tools/orv/field_description.hpp"

#include <cstddef>
#include <expected>
#include <optional>
#include <span>
#include <utility>

#include <orv/byte_buffer.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>
#include <orv/visitor.hpp>

namespace orv::tool {

namespace {

// A decoder whose input is a list of field numbers. It notes the operation that the message reads the last
// one with, and whether the message asks about a conflict in a oneof.
class FieldProbe {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  explicit FieldProbe(std::span<const std::uint32_t> numbers) : numbers_(numbers) {}

  const std::string& label() const { return label_; }
  const std::string& type() const { return type_; }
  const std::string& cases() const { return cases_; }
  bool hasSeenConflict() const { return hasSeenConflict_; }

  template <class M>
  std::expected<std::optional<std::uint32_t>, NeverFails> nextFieldNumber(M&) {
    if (numbers_.empty()) return std::nullopt;
    const std::uint32_t number = numbers_.front();
    numbers_ = numbers_.subspan(1);
    return number;
  }

  Result decodeSingularStringField(Text&) { return note("", "string"); }
  Result decodeSingularStringField(std::optional<Text>&) { return note("optional", "string"); }
  Result decodeSingularBytesField(ByteBuffer&) { return note("", "bytes"); }
  Result decodeSingularBytesField(std::optional<ByteBuffer>&) { return note("optional", "bytes"); }
  Result decodeSingularBoolField(bool&) { return note("", "bool"); }
  Result decodeSingularBoolField(std::optional<bool>&) { return note("optional", "bool"); }
  Result decodeSingularUInt32Field(std::optional<std::uint32_t>&) { return note("optional", "uint32"); }
  Result decodeRepeatedStringField(std::vector<Text>&) { return note("repeated", "string"); }
  template <class Enumeration>
  Result decodeSingularEnumField(std::optional<Enumeration>&) {
    for (const NameMap::Entry& entry : Enumeration::_protobuf_nameMap().entries()) {
      if (!cases_.empty()) cases_ += ", ";
      cases_ += std::string(entry.name) + " = " + std::to_string(entry.number);
    }
    return note("optional", "enum");
  }
  template <class M>
  Result decodeSingularMessageField(std::optional<M>& slot) {
    slot.emplace();
    return note("optional", typeOf<M>().shortName());
  }
  template <class M>
  Result decodeRepeatedMessageField(std::vector<M>&) {
    return note("repeated", typeOf<M>().shortName());
  }
  Result handleConflictingOneOf() {
    hasSeenConflict_ = true;
    return {};
  }

 private:
  Result note(std::string_view label, std::string_view type) {
    label_ = label;
    type_ = type;
    return {};
  }

  std::span<const std::uint32_t> numbers_;
  std::string label_;
  std::string type_;
  std::string cases_;
  bool hasSeenConflict_ = false;
};

template <class M>
FieldProbe probe(std::span<const std::uint32_t> numbers) {
  FieldProbe probe(numbers);
  M message;
  (void)message.decodeMessage(probe);
  return probe;
}

template <class M>
bool shareOneof(std::uint32_t first, std::uint32_t second) {
  const std::uint32_t both[] = {first, second};
  return probe<M>(both).hasSeenConflict();
}

template <class M>
std::vector<FieldDescription> describe() {
  std::vector<FieldDescription> fields;
  std::vector<std::uint32_t> groups;  // the first member of each oneof
  for (const NameMap::Entry& entry : M::_protobuf_nameMap().entries()) {
    const auto number = static_cast<std::uint32_t>(entry.number);
    const FieldProbe found = probe<M>(std::span(&number, 1));
    FieldDescription field{number, entry.name, found.label(), found.type(), found.cases()};
    if (shareOneof<M>(number, number)) {
      std::size_t group = 0;
      while (group < groups.size() && !shareOneof<M>(groups[group], number)) ++group;
      if (group == groups.size()) groups.push_back(number);
      field.label = "oneof " + std::to_string(group + 1);
    }
    fields.push_back(std::move(field));
  }
  return fields;
}

using Describe = std::vector<FieldDescription>();

constexpr auto describeAs = functionPerType<Describe>([]<class M>() -> Describe* { return &describe<M>; });

}  // namespace

std::vector<FieldDescription> describeFields(const MessageType& type) { return describeAs[type.index](); }

}  // namespace orv::tool
