#include <orv/json/renderer.hpp>

#include <algorithm>
#include <utility>

#include <orv/byte_view.hpp>
#include <orv/spelling/base64.hpp>
#include <orv/spelling/hex.hpp>
#include <orv/utf8.hpp>
#include <orv/wire_reader.hpp>

#include "wire_type_names.hpp"

namespace orv::inline v0::json {

namespace {

// Of the characters that do not stand for themselves: those that would act on a terminal, or end a line there or in a
// script, rather than be shown.
bool isControl(char32_t codePoint) { return codePoint < 0xA0 || codePoint == 0x2028 || codePoint == 0x2029; }

// ASCII that stands for itself.
bool standsForItself(char c) { return c >= 0x20 && c < 0x7F && c != '"' && c != '\\'; }

}  // namespace

void Renderer::open(char bracket) {
  output_ += bracket;
  ++depth_;
  isAtFirst_ = true;
}

void Renderer::close(char bracket) {
  --depth_;
  if (!isAtFirst_) startLine();
  output_ += bracket;
  isAtFirst_ = false;
}

void Renderer::startItem() {
  if (!isAtFirst_) output_ += ',';
  isAtFirst_ = false;
  startLine();
}

void Renderer::startLine() {
  if (!options_.isIndented) return;
  output_ += '\n';
  output_.append(2 * depth_, ' ');
}

void Renderer::startMember(std::string_view name) {
  startItem();
  appendQuoted(name);
  output_ += options_.isIndented ? ": " : ":";
}

void appendQuoted(std::string_view utf8, std::string& output) {
  output += '"';
  for (;;) {
    const auto plain =
        static_cast<std::size_t>(std::ranges::find_if_not(utf8, standsForItself) - utf8.begin());
    output += utf8.substr(0, plain);
    utf8.remove_prefix(plain);
    if (utf8.empty()) break;
    const utf8::Step step = utf8::step(utf8);
    switch (step.codePoint) {
      case '"': output += "\\\""; break;
      case '\\': output += "\\\\"; break;
      case '\n': output += "\\n"; break;
      case '\r': output += "\\r"; break;
      case '\t': output += "\\t"; break;
      default:
        if (isControl(step.codePoint)) {
          output += "\\u" + spelling::hexNumber(step.codePoint, 4);
        } else {
          output += utf8.substr(0, step.length);
        }
    }
    utf8.remove_prefix(step.length);
  }
  output += '"';
}

void Renderer::appendBase64(std::string_view bytes) {
  output_ += '"';
  spelling::appendBase64(bytes, output_);
  output_ += '"';
}

Renderer::Result Renderer::visitUnknownFields(const UnknownStorage& unknownFields) {
  if (!options_.showsUnknownFields) return {};
  startMember("unknownFields");
  open('[');
  for (const UnknownField& field : unknownFields) appendUnknown(field);
  close(']');
  return {};
}

void Renderer::appendUnknown(const UnknownField& field) {
  startItem();
  // On one line: there may be millions of them.
  const bool isIndented = std::exchange(options_.isIndented, false);
  open('{');
  startMember("number");
  output_ += std::to_string(field.tag.fieldNumber());
  startMember("wireType");
  appendQuoted(wireTypeNames[static_cast<std::size_t>(field.tag.wireType())]);
  startMember("value");
  if (options_.hidesSecrets) {
    appendQuoted("<redacted>");
    return close('}');
  }
  // What is kept is well-formed.
  WireReader reader(field.value);
  switch (field.tag.wireType()) {
    case WireType::varint: appendQuoted(std::to_string(*reader.readVarint())); break;
    case WireType::fixed64: appendQuoted(std::to_string(*reader.readFixed64())); break;
    case WireType::fixed32: output_ += std::to_string(*reader.readFixed32()); break;
    case WireType::lengthDelimited: appendBase64(charactersOf(*reader.readLengthDelimited())); break;
    case WireType::startGroup:
      open('[');
      // The body ends with an end-group tag of its own.
      for (auto inner = UnknownStorage::Iterator(field.value); inner->tag.wireType() != WireType::endGroup;
           ++inner) {
        appendUnknown(*inner);
      }
      close(']');
      break;
    case WireType::endGroup: break;  // not covered: it stands in no record of its own
  }
  if (!field.isShortest()) {
    startMember("record");
    appendBase64(charactersOf(field.record));
  }
  close('}');
  options_.isIndented = isIndented;
}

}  // namespace orv::json
