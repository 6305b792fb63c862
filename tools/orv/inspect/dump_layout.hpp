// How an annotated dump is set, for a given width.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "tools/orv/output/palette.hpp"

namespace orv::tool {

// Sets the rows of a dump: offset, bytes, and beside the bytes' first row what they are. A value that would
// be cut there stands beside the second.
class DumpLayout {
 public:
  // A width of 0 is that of no terminal: rows are as long as they are.
  DumpLayout(std::size_t width, Palette palette);

  // What stands beside bytes. Path and kind are ASCII.
  struct Note {
    std::size_t depth = 0;  // of payloads
    std::string_view path;
    std::string_view kind;
    std::string_view value;
    Palette::Colour colour = Palette::Colour::value;
  };

  // Bytes that are one record, or part of it: first those of tag and length, then those of the value.
  struct Bytes {
    std::uint64_t offset;
    std::span<const std::byte> header;
    std::span<const std::byte> value;
    Palette::Colour valueColour = Palette::Colour::value;
  };

  void appendHeading(std::string& output, std::string_view text) const;
  void appendRecord(std::string& output, const Bytes& bytes, const Note& note) const;
  // A line in the notes' place, or from the left where it is too long for that.
  void appendError(std::string& output, std::string_view text) const;

 private:
  class Rows;

  std::size_t roomBehind(std::size_t column) const { return column < width_ ? width_ - column : 0; }

  std::size_t width_;
  std::size_t bytesPerRow_;
  std::size_t noteColumn_;
  // Of path and kind, where they are set in columns, with the gap behind.
  std::size_t pathWidth_;
  std::size_t kindWidth_;
  Palette palette_;
};

}  // namespace orv::tool
