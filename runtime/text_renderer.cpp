#include "runtime/text_renderer.hpp"

#include <array>
#include <charconv>

namespace orv {

namespace {

// What the official printer allows (its kUnknownFieldRecursionLimit).
constexpr int unknownLevels = 10;

template <class Number>
std::string hexadecimal(Number value) {
  std::string digits(2 * sizeof value, '0');
  for (std::size_t at = digits.size(); at-- > 0; value >>= 4) digits[at] = "0123456789abcdef"[value & 0xF];
  return "0x" + digits;
}

}  // namespace

std::string TextRenderer::fieldName(std::uint32_t number) const {
  const auto name = names_.name(number);
  return name ? std::string(*name) : std::to_string(number);
}

void TextRenderer::startLine(std::string_view name) {
  output_.append(indentation_, ' ');
  output_ += name;
}

void TextRenderer::open(std::string_view name) {
  startLine(name);
  output_ += " {\n";
  indentation_ += 2;
}

void TextRenderer::close() {
  indentation_ -= 2;
  startLine("}\n");
}

TextRenderer::Result TextRenderer::plain(std::string_view name, std::string_view value) {
  startLine(name);
  output_ += ": ";
  output_ += value;
  output_ += '\n';
  return {};
}

TextRenderer::Result TextRenderer::quoted(std::string_view name, std::string_view bytes) {
  startLine(name);
  output_ += ": ";
  appendQuoted(bytes);
  output_ += '\n';
  return {};
}

// Printable ASCII as it is, the rest as C escapes: by name where C has one, else in three octal digits.
void TextRenderer::appendQuoted(std::string_view bytes) {
  output_ += '"';
  for (const char character : bytes) {
    const auto byte = static_cast<unsigned char>(character);
    switch (character) {
      case '\n': output_ += "\\n"; break;
      case '\r': output_ += "\\r"; break;
      case '\t': output_ += "\\t"; break;
      case '"': output_ += "\\\""; break;
      case '\'': output_ += "\\'"; break;
      case '\\': output_ += "\\\\"; break;
      default:
        if (byte >= 0x20 && byte < 0x7F) {
          output_ += character;
        } else {
          output_ += '\\';
          output_ += static_cast<char>('0' + (byte >> 6));
          output_ += static_cast<char>('0' + ((byte >> 3) & 7));
          output_ += static_cast<char>('0' + (byte & 7));
        }
    }
  }
  output_ += '"';
}

TextRenderer::Result TextRenderer::visitUnknownFields(const UnknownStorage& unknownFields) {
  for (const UnknownField& field : unknownFields) renderUnknown(field, unknownLevels);
  return {};
}

void TextRenderer::renderUnknown(const UnknownField& field, int levelsLeft) {
  // Always by number, also where the message has a name for it that belongs to another wire type.
  const std::string name = std::to_string(field.tag.fieldNumber());
  // What is kept is well-formed.
  WireReader reader(field.value);
  switch (field.tag.wireType()) {
    case WireType::varint: (void)plain(name, std::to_string(*reader.readVarint())); break;
    case WireType::fixed32: (void)plain(name, hexadecimal(*reader.readFixed32())); break;
    case WireType::fixed64: (void)plain(name, hexadecimal(*reader.readFixed64())); break;
    case WireType::lengthDelimited:
      renderUnknownLengthDelimited(name, *reader.readLengthDelimited(), levelsLeft);
      break;
    case WireType::startGroup: renderUnknownGroup(name, field.value, levelsLeft); break;
    case WireType::endGroup: break;
  }
}

void TextRenderer::renderUnknownLengthDelimited(std::string_view name, std::span<const std::byte> body,
                                                int levelsLeft) {
  if (!body.empty() && levelsLeft > 0) {
    if (const auto fields = UnknownStorage::checked(body)) {
      open(name);
      for (const UnknownField& field : *fields) renderUnknown(field, levelsLeft - 1);
      close();
      return;
    }
  }
  (void)quoted(name, {reinterpret_cast<const char*>(body.data()), body.size()});
}

// The body ends with an end-group tag of its own.
void TextRenderer::renderUnknownGroup(std::string_view name, std::span<const std::byte> body,
                                      int levelsLeft) {
  open(name);
  for (auto field = UnknownStorage::Iterator(body); field->tag.wireType() != WireType::endGroup; ++field) {
    renderUnknown(*field, levelsLeft - 1);
  }
  close();
}

}  // namespace orv
