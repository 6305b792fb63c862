#include "tools/orv/inspect/dump_layout.hpp"

#include <algorithm>

#include <orv/byte_view.hpp>
#include <orv/spelling/hex.hpp>

namespace orv::tool {

namespace {

constexpr std::size_t offsetDigits = 4;
constexpr std::size_t pathColumn = 32;
constexpr std::size_t kindColumn = 7;

// Terminals from these widths on have room for so much.
constexpr std::size_t wide = 140;
constexpr std::size_t middling = 100;
constexpr std::size_t narrow = 72;

std::size_t rowSize(std::size_t width) {
  if (width == 0) return 8;
  if (width >= wide) return 16;
  return width >= narrow ? 8 : 4;
}

std::size_t columns(std::string_view text) {
  return static_cast<std::size_t>(std::ranges::count_if(text, spelling::startsCharacter));
}

// How much of the text stands in so many columns, where an ellipsis takes the place of the first character that
// is left out.
std::string_view fitting(std::string_view text, std::size_t room) {
  if (text.size() <= room || columns(text) <= room) return text;
  std::size_t end = 0;
  for (std::size_t started = 0; end < text.size(); ++end) {
    if (spelling::startsCharacter(text[end]) && ++started >= room) break;
  }
  return text.substr(0, end);
}

}  // namespace

DumpLayout::DumpLayout(std::size_t width, Palette palette)
    : width_(width),
      bytesPerRow_(rowSize(width)),
      isAligned_(width == 0 || width >= middling),
      palette_(palette) {}

std::size_t DumpLayout::noteColumn() const { return offsetDigits + 2 + 3 * bytesPerRow_ + 1; }

void DumpLayout::appendHeading(std::string& output, std::string_view text) const {
  palette_.append(output, Palette::Colour::payload, text);
  output += '\n';
}

void DumpLayout::appendRecord(std::string& output, const Bytes& bytes, const Note& note) const {
  const std::size_t size = bytes.header.size() + bytes.value.size();
  const bool isValueBelow = !fitsBeside(note);
  const std::size_t end = std::max(size, isValueBelow ? bytesPerRow_ + 1 : 1);
  for (std::size_t row = 0; row < end; row += bytesPerRow_) {
    if (row == 0 || row < size) {
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
  palette_.append(output, Palette::Colour::offset, spelling::hexNumber(bytes.offset + row, offsetDigits));
  output += "  ";
  const auto append = [&](Palette::Colour colour, std::span<const std::byte> part) {
    if (part.empty()) return;
    palette_.start(output, colour);
    spelling::appendHex(charactersOf(part), output, " ");
    output += ' ';
    palette_.stop(output);
  };
  const std::size_t headerEnd = bytes.header.size();
  const std::size_t end = std::min(row + bytesPerRow_, headerEnd + bytes.value.size());
  const std::size_t split = std::clamp(headerEnd, row, std::max(row, end));
  append(Palette::Colour::tag, bytes.header.subspan(std::min(row, headerEnd), split - row));
  if (end > split) append(bytes.valueColour, bytes.value.subspan(split - headerEnd, end - split));
  output.append(3 * (bytesPerRow_ - (std::max(row, end) - row)) + 1, ' ');
}

std::size_t DumpLayout::indentation(const Note& note) { return 2 * note.depth; }

std::size_t DumpLayout::pathWidth(const Note& note) const {
  const std::size_t column = isAligned_ ? pathColumn - std::min(pathColumn, indentation(note)) : 0;
  return std::max(columns(note.path), column) + 2;
}

std::size_t DumpLayout::kindWidth(const Note& note) const {
  return std::max(columns(note.kind), isAligned_ ? kindColumn : 0) + 2;
}

std::size_t DumpLayout::roomBehind(std::size_t column) const {
  return width_ == 0 ? std::string::npos : width_ - std::min(width_, column);
}

bool DumpLayout::fitsBeside(const Note& note) const {
  if (width_ == 0) return true;
  const std::size_t start = noteColumn() + indentation(note) + pathWidth(note) + kindWidth(note);
  return columns(note.value) <= roomBehind(start);
}

void DumpLayout::appendFitting(std::string& output, Palette::Colour colour, std::string_view text,
                               std::size_t room) const {
  const std::string_view shown = fitting(text, room);
  const bool isCut = shown.size() < text.size() && room != 0;
  if (shown.empty() && !isCut) return;
  palette_.start(output, colour);
  output += shown;
  if (isCut) output += "…";
  palette_.stop(output);
}

void DumpLayout::appendNote(std::string& output, const Note& note) const {
  std::size_t column = noteColumn() + std::min(roomBehind(noteColumn()), indentation(note));
  output.append(column - noteColumn(), ' ');
  const auto append = [&](Palette::Colour colour, std::string_view text, std::size_t width) {
    const std::size_t room = std::min(width, roomBehind(column));
    appendFitting(output, colour, text, room);
    output.append(room - std::min(room, columns(text)), ' ');
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
  const bool fits = width_ == 0 || noteColumn() + columns(text) <= width_;
  output.append(fits ? noteColumn() : 0, ' ');
  palette_.append(output, Palette::Colour::error, text);
  output += '\n';
}

}  // namespace orv::tool
