#include <orv/text_renderer.hpp>

#include <google/protobuf/io/coded_stream.h>

#include <algorithm>
#include <array>
#include <limits>

#include <orv/internal/hex_digits.hpp>

namespace orv::inline v0 {

namespace {

using google::protobuf::io::CodedInputStream;

// What the official printer allows (its kUnknownFieldRecursionLimit).
constexpr int unknownLevels = 10;

// How bytes stand between quotation marks: printable ASCII as it is, the rest as C escapes, by name where C
// has one, else in three octal digits.
enum : char { asItIs = 0, inOctal = 1 };  // anything else is the escape's name
constexpr std::size_t longestEscape = 4;

constexpr auto escapes = [] {
  std::array<char, 256> table{};
  for (std::size_t byte = 0; byte < table.size(); ++byte) {
    table[byte] = byte >= 0x20 && byte < 0x7F ? asItIs : inOctal;
  }
  table['\n'] = 'n';
  table['\r'] = 'r';
  table['\t'] = 't';
  for (const char itself : {'"', '\'', '\\'}) table[static_cast<unsigned char>(itself)] = itself;
  return table;
}();

// Answers where it ended. There is room for the longest escape of each byte.
char* writeEscaped(std::string_view bytes, char* target) {
  for (const char character : bytes) {
    const auto byte = static_cast<unsigned char>(character);
    const char escape = escapes[byte];
    if (escape == asItIs) {
      *target++ = character;
      continue;
    }
    *target++ = '\\';
    if (escape == inOctal) {
      *target++ = static_cast<char>('0' + (byte >> 6));
      *target++ = static_cast<char>('0' + ((byte >> 3) & 7));
      *target++ = static_cast<char>('0' + (byte & 7));
    } else {
      *target++ = escape;
    }
  }
  return target;
}

template <class Number>
std::string hexadecimal(Number value) {
  return "0x" + internal::hexNumber(value, 2 * sizeof value);
}

}  // namespace

// Unknown fields, read as the official printer reads them. Whether the bytes of a length-delimited one are
// shown as a message is decided by libprotobuf's reader, which takes more than ours: only so is the text the
// same.
class TextRenderer::UnknownFieldsRenderer {
 public:
  explicit UnknownFieldsRenderer(TextRenderer& renderer) : renderer_(renderer) {}

  // Writes record after record up to the end of the input or of a group. False if one cannot be read.
  bool renderRecords(CodedInputStream& input, int levelsLeft) {
    for (;;) {
      const std::uint32_t tag = input.ReadTag();
      if (tag == 0 || wireTypeOf(tag) == WireType::endGroup) return true;
      if (tag >> 3 == 0 || !renderValue(input, tag, levelsLeft)) return false;
    }
  }

 private:
  static WireType wireTypeOf(std::uint32_t tag) { return Tag{tag}.wireType(); }

  // Always by number, also where the message has a name for it that belongs to another wire type.
  bool renderValue(CodedInputStream& input, std::uint32_t tag, int levelsLeft) {
    const std::string name = std::to_string(tag >> 3);
    std::uint64_t wide = 0;
    std::uint32_t narrow = 0;
    switch (wireTypeOf(tag)) {
      case WireType::varint: return input.ReadVarint64(&wide) && renderer_.plain(name, std::to_string(wide));
      case WireType::fixed64:
        return input.ReadLittleEndian64(&wide) && renderer_.plain(name, hexadecimal(wide));
      case WireType::fixed32:
        return input.ReadLittleEndian32(&narrow) && renderer_.plain(name, hexadecimal(narrow));
      case WireType::lengthDelimited: {
        std::string body;
        if (!input.ReadVarint32(&narrow) || !input.ReadString(&body, static_cast<int>(narrow))) return false;
        if (!renderAsMessage(name, body, levelsLeft)) (void)renderer_.quoted(name, body);
        return true;
      }
      case WireType::startGroup: {
        if (!input.IncrementRecursionDepth()) return false;
        renderer_.open(name);
        const bool isRead = renderRecords(input, levelsLeft - 1);
        renderer_.close();
        input.DecrementRecursionDepth();
        return isRead && input.LastTagWas((tag & ~7U) | static_cast<std::uint32_t>(WireType::endGroup));
      }
      case WireType::endGroup: break;
    }
    return false;
  }

  // Takes back what it wrote if the bytes turn out not to be a message.
  bool renderAsMessage(std::string_view name, const std::string& body, int levelsLeft) {
    if (body.empty() || levelsLeft <= 0) return false;
    CodedInputStream input(reinterpret_cast<const std::uint8_t*>(body.data()), static_cast<int>(body.size()));
    input.SetRecursionLimit(levelsLeft);
    const std::size_t sizeBefore = renderer_.output_.size();
    renderer_.open(name);
    const bool isMessage = renderRecords(input, levelsLeft - 1) && input.ConsumedEntireMessage();
    renderer_.close();
    if (!isMessage) renderer_.output_.resize(sizeBefore);
    return isMessage;
  }

  TextRenderer& renderer_;
};

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

void TextRenderer::appendQuoted(std::string_view bytes) {
  // Piece by piece, so that the room for the longest escapes is never much more than the text takes.
  constexpr std::size_t pieceSize = 4096;
  output_ += '"';
  for (; !bytes.empty(); bytes.remove_prefix(std::min(bytes.size(), pieceSize))) {
    const std::string_view piece = bytes.substr(0, pieceSize);
    const std::size_t before = output_.size();
    output_.resize_and_overwrite(before + longestEscape * piece.size(), [&](char* output, std::size_t) {
      return static_cast<std::size_t>(writeEscaped(piece, output + before) - output);
    });
  }
  output_ += '"';
}

TextRenderer::Result TextRenderer::visitUnknownFields(const UnknownStorage& unknownFields) {
  UnknownFieldsRenderer renderer(*this);
  for (const UnknownField& field : unknownFields) {
    // The library counts in an int. Only a group can be a larger record.
    if (field.record.size() > std::numeric_limits<int>::max()) {
      (void)quoted(std::to_string(field.tag.fieldNumber()),
                   {reinterpret_cast<const char*>(field.value.data()), field.value.size()});
      continue;
    }
    CodedInputStream input(reinterpret_cast<const std::uint8_t*>(field.record.data()),
                           static_cast<int>(field.record.size()));
    (void)renderer.renderRecords(input, unknownLevels);
  }
  return {};
}

}  // namespace orv
