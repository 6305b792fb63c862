// Writes messages as JSON.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <string>
#include <string_view>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/name_map.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::json {

struct RenderOptions {
  // A member a line; otherwise the whole document is one line.
  bool isIndented = false;
  // Adds a member "unknownFields" to objects that have any: a list of {"number", "wireType", "value"} in the
  // order of their arrival, 64-bit values as strings, lengths of bytes in base64, groups as lists. Reading
  // does not take it.
  bool showsUnknownFields = false;
};

// A visitor that writes what it is handed as the members of an object.
class Renderer {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  // Appends to `output`.
  explicit Renderer(std::string& output, RenderOptions options = {}) : output_(output), options_(options) {}

  template <class M>
  void render(const M& message) {
    const NameMap outer = names_;
    names_ = M::_protobuf_nameMap();
    open('{');
    (void)message.traverse(*this);
    close('}');
    names_ = outer;
  }

  // The operations that Visitor lists.

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    startMember(number);
    appendText(value.utf8());
    return {};
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    startMember(number);
    appendBytes(value.characters());
    return {};
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    startMember(number);
    output_ += value ? "true" : "false";
    return {};
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    startMember(number);
    output_ += std::to_string(value);
    return {};
  }
  // By name, or by number where the raw value has none.
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    startMember(number);
    if (const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue())) {
      appendText(*name);
    } else {
      output_ += std::to_string(value.rawValue());
    }
    return {};
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    startMember(number);
    render(message);
    return {};
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    startMember(number);
    open('[');
    for (const Text& text : texts) {
      startItem();
      appendText(text.utf8());
    }
    close(']');
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    startMember(number);
    open('[');
    for (const M& message : messages) {
      startItem();
      render(message);
    }
    close(']');
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  void open(char bracket);
  void close(char bracket);
  // What stands between two members or list items, and before the first.
  void startItem();
  void startMember(std::string_view name);
  void startMember(std::uint32_t number);
  void appendText(std::string_view utf8);
  void appendBytes(std::string_view bytes);
  void renderUnknown(const UnknownField& field);

  std::string& output_;
  RenderOptions options_;
  NameMap names_;
  std::size_t depth_ = 0;
  bool isAtFirst_ = true;  // whether the innermost object or list is still empty
};

}  // namespace orv::json
