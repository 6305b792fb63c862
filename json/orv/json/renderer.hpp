// Writes messages as JSON.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <orv/any_value_visitor.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>

namespace orv::inline v0::json {

// How a Renderer writes.
struct RenderOptions {
  // A member a line; otherwise the whole document is one line.
  bool isIndented = false;
  // Adds a member "unknownFields" to objects that have any: a list of {"number", "wireType", "value"} in the
  // order of their arrival, 64-bit values as strings, bytes in base64, groups as lists. Where that does not say
  // how long a number is spelled, {"record"} has all bytes in base64. Reading makes the same bytes of it.
  bool showsUnknownFields = false;
  // Writes "<redacted>" for the values of secret fields, and of unknown ones.
  bool hidesSecrets = false;
};

// Appends text as a JSON string. Ill-formed text is none of JSON's.
void appendQuoted(std::string_view utf8, std::string& output);

// A visitor that writes what it is handed as the members of an object.
class Renderer : public AnyValueVisitor<Renderer> {
 public:
  // Appends to `output`.
  explicit Renderer(std::string& output, RenderOptions options = {}) : output_(output), options_(options) {}

  template <class M>
  void render(const M& message) {
    open('{');
    (void)walkNested(message);
    close('}');
  }

  template <class T>
  Result visitAnyValue(const T& value, std::uint32_t number) {
    return visitMember(number, [&] { append(value); });
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    return visitMember(number, [&] { render(message); });
  }
  Result visitRepeatedStringField(const std::vector<Text>& texts, std::uint32_t number) {
    return visitList(texts, number, [&](const Text& text) { append(text); });
  }
  template <class M>
  Result visitRepeatedMessageField(const std::vector<M>& messages, std::uint32_t number) {
    return visitList(messages, number, [&](const M& message) { render(message); });
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  void open(char bracket);
  void close(char bracket);
  // What stands between two members or list items, and before the first.
  void startItem();
  // Where lines are indented.
  void startLine();
  void startMember(std::string_view name);

  template <class Append>
  Result visitMember(std::uint32_t number, Append appendValue) {
    startMember(fieldName(number));
    if (options_.hidesSecrets && (field(number) == nullptr || field(number)->isSecret)) {
      appendQuoted("<redacted>");
    } else {
      appendValue();
    }
    return {};
  }
  template <class T, class Append>
  Result visitList(const std::vector<T>& items, std::uint32_t number, Append appendItem) {
    return visitMember(number, [&] {
      open('[');
      for (const T& item : items) {
        startItem();
        appendItem(item);
      }
      close(']');
    });
  }

  void append(const Text& text) { appendQuoted(text.utf8()); }
  void append(const ByteBuffer& bytes) { appendBase64(bytes.characters()); }
  void append(bool value) { output_ += value ? "true" : "false"; }
  void append(std::uint32_t value) { output_ += std::to_string(value); }
  // By name, or by number where the raw value has none.
  template <class Enumeration>
  void append(const Enumeration& value) {
    if (const auto name = Enumeration::_protobuf_nameMap().name(value.rawValue())) {
      appendQuoted(*name);
    } else {
      output_ += std::to_string(value.rawValue());
    }
  }
  void appendQuoted(std::string_view utf8) { json::appendQuoted(utf8, output_); }
  void appendBase64(std::string_view bytes);
  void appendUnknown(const UnknownField& field);

  std::string& output_;
  RenderOptions options_;
  std::size_t depth_ = 0;
  bool isAtFirst_ = true;  // whether the innermost object or list is still empty
};

}  // namespace orv::json
