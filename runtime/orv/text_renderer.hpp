// Renders messages as text.
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

namespace orv {

// A visitor that writes the text format of Protocol Buffers (protobuf.dev, "Text Format"), a field a line.
// Unknown fields are written by number; one that is length-delimited and reads as a sequence of records is
// shown as a message, as the official printer does, to ten levels.
class TextRenderer {
 public:
  using Error = NeverFails;
  using Result = std::expected<void, NeverFails>;

  // Appends to `output`. The names are those of the message that is to be walked.
  TextRenderer(std::string& output, NameMap names) : output_(output), names_(names) {}

  Result visitSingularStringField(const Text& value, std::uint32_t number) {
    return quoted(fieldName(number), value.utf8());
  }
  Result visitSingularBytesField(const ByteBuffer& value, std::uint32_t number) {
    return quoted(fieldName(number), value.characters());
  }
  Result visitSingularBoolField(bool value, std::uint32_t number) {
    return plain(fieldName(number), value ? "true" : "false");
  }
  Result visitSingularUInt32Field(std::uint32_t value, std::uint32_t number) {
    return plain(fieldName(number), std::to_string(value));
  }
  // By name, or by number where the raw value has none.
  template <class Enumeration>
  Result visitSingularEnumField(const Enumeration& value, std::uint32_t number) {
    const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue());
    return plain(fieldName(number), name ? std::string(*name) : std::to_string(value.rawValue()));
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    open(fieldName(number));
    const NameMap outer = names_;
    names_ = M::_protobuf_nameMap();
    (void)message.traverse(*this);
    names_ = outer;
    close();
    return {};
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    for (const Text& text : texts) (void)visitSingularStringField(text, number);
    return {};
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    for (const M& message : messages) (void)visitSingularMessageField(message, number);
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  std::string fieldName(std::uint32_t number) const;
  void startLine(std::string_view name);
  void open(std::string_view name);
  void close();
  Result plain(std::string_view name, std::string_view value);
  Result quoted(std::string_view name, std::string_view bytes);
  void appendQuoted(std::string_view bytes);

  class UnknownFieldsRenderer;

  std::string& output_;
  NameMap names_;
  std::size_t indentation_ = 0;
};

}  // namespace orv
