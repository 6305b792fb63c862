// Renders messages as text.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include <orv/any_value_visitor.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

// A visitor that writes the text format of Protocol Buffers (protobuf.dev, "Text Format"), a field a line.
// Unknown fields are written by number; one that is length-delimited and reads as a sequence of records is
// shown as a message, as the official printer does, to ten levels.
class TextRenderer : public AnyValueVisitor<TextRenderer> {
 public:
  // Appends to `output`.
  explicit TextRenderer(std::string& output) : output_(output) {}

  Result visitAnyValue(const Text& value, std::uint32_t number) {
    return quoted(fieldName(number), value.utf8());
  }
  Result visitAnyValue(const ByteBuffer& value, std::uint32_t number) {
    return quoted(fieldName(number), value.characters());
  }
  Result visitAnyValue(bool value, std::uint32_t number) {
    return plain(fieldName(number), value ? "true" : "false");
  }
  Result visitAnyValue(std::uint32_t value, std::uint32_t number) {
    return plain(fieldName(number), std::to_string(value));
  }
  // By name, or by number where the raw value has none.
  template <class Enumeration>
  Result visitAnyValue(const Enumeration& value, std::uint32_t number) {
    const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue());
    return plain(fieldName(number), name ? std::string(*name) : std::to_string(value.rawValue()));
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    open(fieldName(number));
    (void)walkNested(message);
    close();
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  void startLine(std::string_view name);
  void open(std::string_view name);
  void close();
  Result plain(std::string_view name, std::string_view value);
  Result quoted(std::string_view name, std::string_view bytes);
  void appendQuoted(std::string_view bytes);

  class UnknownFieldsRenderer;

  std::string& output_;
  std::size_t indentation_ = 0;
};

}  // namespace orv
