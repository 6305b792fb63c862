// Renders messages as text.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <string>
#include <string_view>

#include <orv/any_value_visitor.hpp>
#include <orv/byte_buffer.hpp>
#include <orv/text.hpp>
#include <orv/unknown_storage.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0 {

// How a TextRenderer writes.
struct TextStyle {
  bool isOneLine = false;     // a space behind each field in place of a line's end
  bool hidesSecrets = false;  // `<redacted>` for the values of secret fields, and of unknown ones
  // Unknown fields so that the command's reader makes the same bytes of them again, not as the official printer:
  // a length-delimited one is a message only if that is so; records that their text does not describe in full,
  // groups and overlong spellings, stand as `[records]: "…"`, below their text in comments.
  bool isReversible = false;
  // A text of more bytes is cut there, between characters, and ends in "…". What lies beyond costs no memory.
  std::size_t maximumSizeInBytes = std::numeric_limits<std::size_t>::max();
};

// A visitor that writes the text format of Protocol Buffers (protobuf.dev, "Text Format"), a field a line.
// Unknown fields are written by number; one that is length-delimited and reads as a sequence of records is
// shown as a message, as the official printer does, to ten levels.
class TextRenderer : public AnyValueVisitor<TextRenderer> {
 public:
  // Appends to `output`.
  explicit TextRenderer(std::string& output, TextStyle style = {})
      : output_(output), start_(output.size()), style_(style) {}

  // Whether the text was longer than the style allows.
  bool isCut() const { return isCut_; }

  template <class T>
  Result visitAnyValue(const T& value, std::uint32_t number) {
    if (isCut_) return {};
    return hides(number) ? redacted(fieldName(number)) : write(fieldName(number), value);
  }
  template <class M>
  Result visitSingularMessageField(const M& message, std::uint32_t number) {
    if (isCut_) return {};
    if (hides(number)) return redacted(fieldName(number));
    open(fieldName(number));
    (void)walkNested(message);
    close();
    return {};
  }
  Result visitUnknownFields(const UnknownStorage& unknownFields);

 private:
  bool hides(std::uint32_t number) const {
    return style_.hidesSecrets && (field(number) == nullptr || field(number)->isSecret);
  }

  Result write(std::string_view name, const Text& value) { return quoted(name, value.utf8()); }
  Result write(std::string_view name, const ByteBuffer& value) { return quoted(name, value.characters()); }
  Result write(std::string_view name, bool value) { return plain(name, value ? "true" : "false"); }
  Result write(std::string_view name, std::uint32_t value) { return plain(name, std::to_string(value)); }
  // By name, or by number where the raw value has none.
  template <class Enumeration>
  Result write(std::string_view name, const Enumeration& value) {
    const auto caseName = Enumeration::_protobuf_nameMap().name(value.rawValue());
    return plain(name, caseName ? std::string(*caseName) : std::to_string(value.rawValue()));
  }
  Result redacted(std::string_view name) { return plain(name, "<redacted>"); }

  void open(std::string_view name);
  void close();
  Result plain(std::string_view name, std::string_view value);
  Result quoted(std::string_view name, std::string_view bytes);
  void makeComment(std::size_t start);

  void append(std::string_view name, std::size_t room, auto write);
  char* startLine(std::string_view name, char* at) const;
  char* endLine(char* at) const;
  std::size_t indentation() const { return style_.isOneLine ? 0 : indentation_; }
  void cut();

  class UnknownFieldsRenderer;

  std::string& output_;
  std::size_t start_;  // of what is written, in the output
  TextStyle style_;
  bool isCut_ = false;  // nothing more is written
  std::size_t indentation_ = 0;
};

}  // namespace orv
