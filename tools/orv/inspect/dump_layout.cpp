#include "tools/orv/inspect/dump_layout.hpp"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <limits>

#include <orv/internal/hex_digits.hpp>
#include <orv/spelling/value_text.hpp>

namespace orv::tool {

namespace {

// Of the bytes: the offset's digits, of which there are rarely more than four, and a gap.
constexpr std::size_t offsetDigits = 4;
constexpr std::size_t bytesColumn = offsetDigits + 2;
constexpr std::size_t pathColumn = 32;
constexpr std::size_t kindColumn = 7;
constexpr std::size_t gap = 2;

// Terminals from these widths on have room for so much.
constexpr std::size_t wide = 140;
constexpr std::size_t middling = 100;
constexpr std::size_t narrow = 72;

std::size_t rowSize(std::size_t width) {
  if (width == 0) return 8;
  if (width >= wide) return 16;
  return width >= narrow ? 8 : 4;
}

// Of each byte, with the space behind, and one more character so that it is copied at once.
constexpr auto spacedDigits = [] {
  std::array<std::array<char, 4>, 256> table{};
  for (std::size_t byte = 0; byte < table.size(); ++byte)
    table[byte] = {internal::hexDigits[byte >> 4], internal::hexDigits[byte & 0xF], ' ', ' '};
  return table;
}();

// A text takes no more columns than bytes.
bool fits(std::string_view text, std::size_t room) {
  return text.size() <= room || spelling::columns(text) <= room;
}

}  // namespace

// Sets the rows of a record in room that there is for them.
class DumpLayout::Rows {
 public:
  Rows(const DumpLayout& layout, char* start) : layout_(layout), row_(start), at_(start) {}

  // What the rows of a record take at most, in characters.
  static std::size_t roomFor(const DumpLayout& layout, std::size_t rows, const Note& note) {
    constexpr std::size_t longestOffset = 16;
    constexpr std::size_t colours = 64;
    return rows * (longestOffset + gap + 3 * layout.bytesPerRow_ + 1 + colours) + 2 * layout.noteColumn_ +
           layout.pathWidth_ + layout.kindWidth_ + note.path.size() + note.kind.size() + note.value.size() +
           3 * (colours + 2 * note.depth);
  }

  const char* end() const { return at_; }

  // Up to the note, so far indented.
  void addGap(std::size_t column, std::size_t indentation) {
    addSpaces(std::max(column + 1, layout_.noteColumn_) - column);
    addSpaces(std::min(indentation, layout_.roomBehind(layout_.noteColumn_)));
  }

  // As much of the text as the room holds, with an ellipsis where it is cut.
  void addFitting(Palette::Colour colour, std::string_view text, std::size_t room) {
    if (text.empty() || room == 0) return;
    const bool isCut = !fits(text, room);
    startColour(colour);
    add(isCut ? spelling::startWithin(text, room - 1) : text);
    if (isCut) add("…");
    stopColour();
  }

  // In so many columns, of which there may be fewer.
  void addColumn(Palette::Colour colour, std::string_view text, std::size_t width, std::size_t room) {
    width = std::min(width, room);
    addFitting(colour, text, width);
    addSpaces(width - std::min(width, text.size()));
  }

  // Those of the row that begins with the byte `row`. Answers the column behind them.
  std::size_t addBytes(const Bytes& bytes, std::size_t row) {
    const std::size_t headerEnd = bytes.header.size();
    const std::size_t end = std::min(row + layout_.bytesPerRow_, headerEnd + bytes.value.size());
    const std::size_t split = std::clamp(headerEnd, row, end);
    const std::size_t start = addOffset(bytes.offset + row);
    if (split > row) addDigits(Palette::Colour::tag, bytes.header.subspan(row, split - row));
    if (end > split) addDigits(bytes.valueColour, bytes.value.subspan(split - headerEnd, end - split));
    return start + 3 * (end - row);
  }

  void endRow() {
    while (at_ != row_ && at_[-1] == ' ') --at_;
    *at_++ = '\n';
    row_ = at_;
  }

 private:
  void addSpaces(std::size_t count) { at_ = std::fill_n(at_, count, ' '); }
  void add(std::string_view text) { at_ = std::ranges::copy(text, at_).out; }
  void startColour(Palette::Colour colour) { add(layout_.palette_.start(colour)); }
  void stopColour() { add(layout_.palette_.stop()); }

  // Longer offsets take of the gap before the bytes.
  std::size_t addOffset(std::uint64_t offset) {
    const std::size_t digits =
        std::max(offsetDigits, (static_cast<std::size_t>(std::bit_width(offset)) + 3) / 4);
    startColour(Palette::Colour::offset);
    for (std::size_t at = digits; at-- > 0; offset >>= 4) at_[at] = internal::hexDigits[offset & 0xF];
    at_ += digits;
    stopColour();
    const std::size_t end = std::max(digits + 1, bytesColumn);
    addSpaces(end - digits);
    return end;
  }

  void addDigits(Palette::Colour colour, std::span<const std::byte> bytes) {
    startColour(colour);
    for (const std::byte byte : bytes) {
      const auto& digits = spacedDigits[std::to_integer<std::size_t>(byte)];
      std::memcpy(at_, digits.data(), digits.size());
      at_ += 3;
    }
    stopColour();
  }

  const DumpLayout& layout_;
  char* row_;  // where it begins
  char* at_;
};

DumpLayout::DumpLayout(std::size_t width, Palette palette)
    : width_(width == 0 ? std::numeric_limits<std::size_t>::max() : width),
      bytesPerRow_(rowSize(width)),
      noteColumn_(bytesColumn + 3 * bytesPerRow_ + 1),
      pathWidth_(width_ >= middling ? pathColumn + gap : 0),
      kindWidth_(width_ >= middling ? kindColumn + gap : 0),
      palette_(palette) {}

void DumpLayout::appendHeading(std::string& output, std::string_view text) const {
  palette_.append(output, Palette::Colour::payload, text);
  output += '\n';
}

void DumpLayout::appendRecord(std::string& output, const Bytes& bytes, const Note& note) const {
  const std::size_t indentation = 2 * note.depth;
  const std::size_t pathStart = noteColumn_ + indentation;
  const std::size_t kindStart = std::max(noteColumn_ + pathWidth_, pathStart + note.path.size() + gap);
  const std::size_t valueStart = kindStart + std::max(kindWidth_, note.kind.size() + gap);
  const bool isBeside = fits(note.value, roomBehind(valueStart));
  const auto nameColour = note.colour == Palette::Colour::value ? Palette::Colour::name : note.colour;
  const std::size_t size = bytes.header.size() + bytes.value.size();
  const std::size_t end = std::max(size, isBeside ? 1 : bytesPerRow_ + 1);
  const std::size_t before = output.size();
  const std::size_t room = Rows::roomFor(*this, (end + bytesPerRow_ - 1) / bytesPerRow_, note);
  output.resize_and_overwrite(before + room, [&](char* text, std::size_t) {
    Rows rows(*this, text + before);
    for (std::size_t row = 0; row < end; row += bytesPerRow_) {
      const std::size_t column = row < size ? rows.addBytes(bytes, row) : 0;
      if (row == 0) {
        rows.addGap(column, indentation);
        rows.addColumn(nameColour, note.path, kindStart - pathStart, roomBehind(pathStart));
        rows.addColumn(Palette::Colour::kind, note.kind, valueStart - kindStart, roomBehind(kindStart));
        if (isBeside) rows.addFitting(note.colour, note.value, roomBehind(valueStart));
      } else if (row == bytesPerRow_ && !isBeside) {
        rows.addGap(column, indentation + gap);
        rows.addFitting(note.colour, note.value, roomBehind(pathStart + gap));
      }
      rows.endRow();
    }
    return static_cast<std::size_t>(rows.end() - text);
  });
}

void DumpLayout::appendError(std::string& output, std::string_view text) const {
  if (fits(text, roomBehind(noteColumn_))) output.append(noteColumn_, ' ');
  palette_.append(output, Palette::Colour::error, text);
  output += '\n';
}

}  // namespace orv::tool
