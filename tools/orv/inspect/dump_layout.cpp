#include "tools/orv/inspect/dump_layout.hpp"

#include <algorithm>

#include <orv/internal/hex_digits.hpp>
#include <orv/spelling/value_text.hpp>

namespace orv::tool {

namespace {

// Of the bytes: the offset's digits, of which there are rarely more than four, and a gap.
constexpr std::size_t offsetDigits = 4;
constexpr std::size_t bytesColumn = offsetDigits + 2;
constexpr std::size_t pathColumn = 32;
constexpr std::size_t kindColumn = 7;

// Terminals from these widths on have room for so much.
constexpr std::size_t wide = 140;
constexpr std::size_t middling = 100;
constexpr std::size_t narrow = 72;

// As hexNumber, without a string.
std::string_view hexDigits(std::uint64_t number, std::span<char, 16> digits) {
  std::size_t at = digits.size();
  for (; number != 0 || at > digits.size() - offsetDigits; number >>= 4)
    digits[--at] = internal::hexDigits[number & 0xF];
  return {digits.data() + at, digits.size() - at};
}

// Two digits and a space for each byte.
void appendSpacedHex(std::span<const std::byte> bytes, std::string& output) {
  const std::size_t start = output.size();
  output.resize(start + 3 * bytes.size(), ' ');
  char* target = output.data() + start;
  for (const std::byte byte : bytes) {
    *target++ = internal::hexDigits[std::to_integer<std::size_t>(byte >> 4)];
    *target++ = internal::hexDigits[std::to_integer<std::size_t>(byte & std::byte{0xF})];
    ++target;
  }
}

std::size_t rowSize(std::size_t width) {
  if (width == 0) return 8;
  if (width >= wide) return 16;
  return width >= narrow ? 8 : 4;
}

}  // namespace

DumpLayout::DumpLayout(std::size_t width, Palette palette)
    : width_(width),
      bytesPerRow_(rowSize(width)),
      isAligned_(width == 0 || width >= middling),
      palette_(palette) {}

std::size_t DumpLayout::noteColumn() const { return bytesColumn + 3 * bytesPerRow_ + 1; }

void DumpLayout::appendHeading(std::string& output, std::string_view text) const {
  palette_.append(output, Palette::Colour::payload, text);
  output += '\n';
}

void DumpLayout::appendRecord(std::string& output, const Bytes& bytes, const Note& note) const {
  const std::size_t size = bytes.header.size() + bytes.value.size();
  const bool isValueBelow = !fitsBeside(note);
  const std::size_t end = std::max(size, isValueBelow ? bytesPerRow_ + 1 : 1);
  for (std::size_t row = 0; row < end; row += bytesPerRow_) {
    if (row < size) {
      appendBytes(output, bytes, row);
    } else {
      output.append(noteColumn(), ' ');
    }
    if (row == 0) appendNote(output, note);
    if (row == (isValueBelow ? bytesPerRow_ : 0)) appendValue(output, note, isValueBelow);
    while (output.ends_with(' ')) output.pop_back();
    output += '\n';
  }
}

void DumpLayout::appendBytes(std::string& output, const Bytes& bytes, std::size_t row) const {
  char digits[16];
  const std::string_view offset = hexDigits(bytes.offset + row, digits);
  palette_.append(output, Palette::Colour::offset, offset);
  // Longer offsets take of the gaps before and behind the bytes.
  const std::size_t start = std::max(offset.size() + 1, bytesColumn);
  output.append(start - offset.size(), ' ');
  const auto append = [&](Palette::Colour colour, std::span<const std::byte> part) {
    if (part.empty()) return;
    palette_.start(output, colour);
    appendSpacedHex(part, output);
    palette_.stop(output);
  };
  const std::size_t headerEnd = bytes.header.size();
  const std::size_t end = std::max(row, std::min(row + bytesPerRow_, headerEnd + bytes.value.size()));
  const std::size_t split = std::clamp(headerEnd, row, end);
  if (split > row) append(Palette::Colour::tag, bytes.header.subspan(row, split - row));
  if (end > split) append(bytes.valueColour, bytes.value.subspan(split - headerEnd, end - split));
  const std::size_t column = start + 3 * (end - row);
  output.append(std::max(column + 1, noteColumn()) - column, ' ');
}

std::size_t DumpLayout::indentation(const Note& note) { return 2 * note.depth; }

std::size_t DumpLayout::pathWidth(const Note& note) const {
  const std::size_t column = isAligned_ ? pathColumn - std::min(pathColumn, indentation(note)) : 0;
  return std::max(spelling::columns(note.path), column) + 2;
}

std::size_t DumpLayout::kindWidth(const Note& note) const {
  return std::max(spelling::columns(note.kind), isAligned_ ? kindColumn : 0) + 2;
}

std::size_t DumpLayout::roomBehind(std::size_t column) const {
  return width_ == 0 ? std::string::npos : width_ - std::min(width_, column);
}

bool DumpLayout::fitsBeside(const Note& note) const {
  if (width_ == 0) return true;
  const std::size_t start = noteColumn() + indentation(note) + pathWidth(note) + kindWidth(note);
  return spelling::columns(note.value) <= roomBehind(start);
}

std::size_t DumpLayout::appendFitting(std::string& output, Palette::Colour colour, std::string_view text,
                                      std::size_t room) const {
  if (text.empty() || room == 0) return 0;
  const std::size_t width = spelling::columns(text);
  palette_.start(output, colour);
  std::size_t shown = width;
  if (width <= room) {
    output += text;
  } else {
    const std::string_view start = spelling::startWithin(text, room - 1);
    output.append(start).append("…");
    shown = spelling::columns(start) + 1;
  }
  palette_.stop(output);
  return shown;
}

void DumpLayout::appendNote(std::string& output, const Note& note) const {
  std::size_t column = noteColumn() + std::min(roomBehind(noteColumn()), indentation(note));
  output.append(column - noteColumn(), ' ');
  const auto append = [&](Palette::Colour colour, std::string_view text, std::size_t width) {
    const std::size_t room = std::min(width, roomBehind(column));
    output.append(room - appendFitting(output, colour, text, room), ' ');
    column += room;
  };
  append(note.colour == Palette::Colour::value ? Palette::Colour::name : note.colour, note.path,
         pathWidth(note));
  append(Palette::Colour::kind, note.kind, kindWidth(note));
}

void DumpLayout::appendValue(std::string& output, const Note& note, bool isBelow) const {
  std::size_t start = noteColumn() + indentation(note);
  if (isBelow) {
    output.append(std::min(roomBehind(noteColumn()), indentation(note) + 2), ' ');
    start += 2;
  } else if (width_ != 0) {
    start += pathWidth(note) + kindWidth(note);
  }
  appendFitting(output, note.colour, note.value, roomBehind(start));
}

void DumpLayout::appendError(std::string& output, std::string_view text) const {
  const bool fits = width_ == 0 || noteColumn() + spelling::columns(text) <= width_;
  output.append(fits ? noteColumn() : 0, ' ');
  palette_.append(output, Palette::Colour::error, text);
  output += '\n';
}

}  // namespace orv::tool
