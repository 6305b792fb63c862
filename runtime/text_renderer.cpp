#include <orv/text_renderer.hpp>

#include <algorithm>
#include <array>
#include <optional>
#include <span>

#include <orv/byte_view.hpp>
#include <orv/internal/hex_digits.hpp>
#include <orv/wire_reader.hpp>

namespace orv::inline v0 {

namespace {

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

// These answer where they ended. There is room, for the longest escape of each byte.
char* put(std::string_view characters, char* target) { return std::ranges::copy(characters, target).out; }
char* putEscaped(std::string_view bytes, char* target) {
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

// Reads records as the official printer does, which takes more than the strict reader: tags and lengths of up to
// ten bytes, of which the low 32 bits count.
class LenientReader {
 public:
  explicit LenientReader(std::span<const std::byte> bytes) : reader_(bytes) {}

  bool isAtEnd() const { return reader_.isAtEnd(); }

  // A field's tag, or 0 if there is none.
  Tag readTag() {
    const Tag tag{static_cast<std::uint32_t>(readVarint().value_or(0))};
    return tag.fieldNumber() == 0 ? Tag{0} : tag;
  }
  std::optional<std::uint64_t> readVarint() { return valueOf(reader_.readVarint()); }
  std::optional<std::uint64_t> readFixed64() { return valueOf(reader_.readFixed64()); }
  std::optional<std::uint64_t> readFixed32() { return valueOf(reader_.readFixed32()); }
  std::optional<std::span<const std::byte>> readLengthDelimited() {
    const auto length = static_cast<std::uint32_t>(readVarint().value_or(unreadable));
    if (length > reader_.remaining()) return std::nullopt;
    const std::span body(reader_.position(), length);
    reader_ = WireReader({body.data() + length, reader_.remaining() - length});
    return body;
  }

 private:
  static constexpr std::uint32_t unreadable = std::uint32_t{1} << 31;  // a length above all that remains

  template <class Number>
  static std::optional<std::uint64_t> valueOf(const WireResult<Number>& result) {
    return result ? std::optional<std::uint64_t>(*result) : std::nullopt;
  }

  WireReader reader_;
};

// Whether the field's text says all of it.
bool isDescribed(const UnknownField& field) {
  return field.tag.wireType() != WireType::startGroup && field.isShortest();
}

}  // namespace

// Unknown fields, in the words of the official printer, which also decides as here whether the bytes of a
// length-delimited one are shown as a message.
class TextRenderer::UnknownFieldsRenderer {
 public:
  explicit UnknownFieldsRenderer(TextRenderer& renderer) : renderer_(renderer) {}

  // How deep records may still be shown: as messages, and in groups.
  struct Levels {
    int messages;
    int groups;
  };

  // Writes record after record up to the end of the input, or of the group that `start` began. False if that
  // end is not reached.
  bool renderRecords(LenientReader& input, Levels left, std::optional<Tag> start = std::nullopt) {
    while (!input.isAtEnd()) {
      const Tag tag = input.readTag();
      if (tag.wireType() == WireType::endGroup) return start && tag.fieldNumber() == start->fieldNumber();
      if (tag.value == 0 || !renderValue(input, tag, left)) return false;
    }
    return !start;
  }

 private:
  // Always by number, also where the message has a name for it that belongs to another wire type.
  bool renderValue(LenientReader& input, Tag tag, Levels left) {
    const std::string name = std::to_string(tag.fieldNumber());
    const auto number = [&](std::optional<std::uint64_t> value, std::size_t hexDigits) {
      if (!value) return false;
      (void)renderer_.plain(
          name, hexDigits == 0 ? std::to_string(*value) : "0x" + internal::hexNumber(*value, hexDigits));
      return true;
    };
    switch (tag.wireType()) {
      case WireType::varint: return number(input.readVarint(), 0);
      case WireType::fixed64: return number(input.readFixed64(), 16);
      case WireType::fixed32: return number(input.readFixed32(), 8);
      case WireType::lengthDelimited: {
        const auto body = input.readLengthDelimited();
        if (!body) return false;
        if (!renderAsMessage(name, *body, left.messages)) (void)renderer_.quoted(name, charactersOf(*body));
        return true;
      }
      case WireType::startGroup: {
        if (left.groups == 0) return false;
        renderer_.open(name);
        const bool isWhole = renderRecords(input, {left.messages - 1, left.groups - 1}, tag);
        renderer_.close();
        return isWhole;
      }
      case WireType::endGroup: break;  // not covered: renderRecords ends at it
    }
    return false;
  }

  // Takes back what it wrote if the bytes turn out not to be a message.
  bool renderAsMessage(std::string_view name, std::span<const std::byte> body, int levelsLeft) {
    if (renderer_.isCut_) return true;  // either way nothing is written
    if (body.empty() || levelsLeft <= 0) return false;
    if (renderer_.style_.isReversible && !isReversible(body)) return false;
    LenientReader input(body);
    const std::size_t sizeBefore = renderer_.output_.size();
    renderer_.open(name);
    const bool isMessage = renderRecords(input, {levelsLeft - 1, levelsLeft});
    renderer_.close();
    if (!isMessage) {
      renderer_.output_.resize(sizeBefore);
      renderer_.isCut_ = false;
    }
    return isMessage;
  }

  static bool isReversible(std::span<const std::byte> body) {
    const auto records = UnknownStorage::checked(body);
    return records && std::ranges::all_of(records->begin(), records->end(),
                                          [](const UnknownField& field) { return isDescribed(field); });
  }

  TextRenderer& renderer_;
};

// Appends what `write` puts into room for a line's indentation, name and end, and so many bytes more.
void TextRenderer::append(std::string_view name, std::size_t room, auto write) {
  if (isCut_) return;
  const std::size_t before = output_.size();
  const std::size_t mostAdded = indentation() + name.size() + room + 1;
  output_.resize_and_overwrite(before + mostAdded, [&](char* output, std::size_t) {
    return static_cast<std::size_t>(write(output + before) - output);
  });
  if (output_.size() - start_ > style_.maximumSizeInBytes) cut();
}

char* TextRenderer::startLine(std::string_view name, char* at) const {
  return put(name, std::fill_n(at, indentation(), ' '));
}

char* TextRenderer::endLine(char* at) const {
  *at = style_.isOneLine ? ' ' : '\n';
  return at + 1;
}

void TextRenderer::cut() {
  std::size_t end = start_ + style_.maximumSizeInBytes;
  const auto isInsideCharacter = [&] { return (static_cast<unsigned char>(output_[end]) & 0xC0) == 0x80; };
  while (end > start_ && isInsideCharacter()) --end;
  output_.resize(end);
  output_ += "…";
  isCut_ = true;
}

void TextRenderer::open(std::string_view name) {
  append(name, 2, [&](char* at) { return endLine(put(" {", startLine(name, at))); });
  indentation_ += 2;
}

void TextRenderer::close() {
  indentation_ -= 2;
  append("}", 0, [&](char* at) { return endLine(startLine("}", at)); });
}

TextRenderer::Result TextRenderer::plain(std::string_view name, std::string_view value) {
  append(name, 2 + value.size(),
         [&](char* at) { return endLine(put(value, put(": ", startLine(name, at)))); });
  return {};
}

TextRenderer::Result TextRenderer::quoted(std::string_view name, std::string_view bytes) {
  // Long ones piece by piece, so that the room for the longest escapes is never much more than the text takes.
  constexpr std::size_t pieceSize = 4096;
  for (std::size_t done = 0;;) {
    const std::string_view piece = bytes.substr(done, pieceSize);
    append(name, longestEscape * piece.size() + 4, [&](char* at) {
      if (done == 0) at = put(": \"", startLine(name, at));
      at = putEscaped(piece, at);
      return done + piece.size() == bytes.size() ? endLine(put("\"", at)) : at;
    });
    done += piece.size();
    if (done == bytes.size() || isCut_) return {};
  }
}

TextRenderer::Result TextRenderer::visitUnknownFields(const UnknownStorage& unknownFields) {
  UnknownFieldsRenderer renderer(*this);
  for (const UnknownField& field : unknownFields) {
    if (isCut_) return {};
    if (style_.hidesSecrets) {
      (void)redacted(std::to_string(field.tag.fieldNumber()));
      continue;
    }
    const std::size_t start = output_.size();
    LenientReader input(field.record);
    (void)renderer.renderRecords(input, {unknownLevels, internal::maximumNesting});
    if (style_.isReversible && !isCut_ && !isDescribed(field)) {
      makeComment(start);
      (void)quoted("[records]", charactersOf(field.record));
    }
  }
  return {};
}

// Of the lines from there on.
void TextRenderer::makeComment(std::size_t start) {
  const std::string lines = output_.substr(start);
  output_.resize(start);
  for (std::size_t at = 0; at < lines.size();) {
    const std::size_t end = std::min(lines.find('\n', at), lines.size() - 1) + 1;
    output_.append(indentation_, ' ').append("# ").append(lines, at + indentation_, end - at - indentation_);
    at = end;
  }
}

}  // namespace orv
