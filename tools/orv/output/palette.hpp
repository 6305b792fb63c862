// Colours on a terminal.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "tools/orv/options.hpp"

namespace orv::tool {

bool isTerminal(int descriptor);

// Columns of the terminal at the descriptor; none for what is no terminal, or does not say.
std::size_t terminalWidth(int descriptor);

// Colours for what is written, or none at all.
class Palette {
 public:
  // Automatic: on a terminal that can, unless NO_COLOR (no-color.org) is set.
  Palette(ColourChoice choice, int descriptor);

  enum class Colour : std::uint8_t {
    offset,
    tag,
    name,
    kind,
    value,
    unknown,
    payload,
    error,
    removed,
    added
  };

  // Appends the text in the colour.
  void append(std::string& output, Colour colour, std::string_view text) const;

  // What is appended from the start to the stop is in the colour.
  void start(std::string& output, Colour colour) const {
    if (isOn_) startColour(output, colour);
  }
  void stop(std::string& output) const {
    if (isOn_) output += "\033[0m";
  }

 private:
  static void startColour(std::string& output, Colour colour);

  bool isOn_;
};

}  // namespace orv::tool
