// Colours on a terminal.
#pragma once

#include <array>
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

  // What stands from the start to the stop is in the colour.
  std::string_view start(Colour colour) const { return isOn_ ? codes[static_cast<std::size_t>(colour)] : ""; }
  std::string_view stop() const { return isOn_ ? "\033[0m" : ""; }

 private:
  // In the order of Colour: grey, cyan, bold, blue, plain, yellow, magenta, red, red, green.
  static constexpr std::array<std::string_view, 10> codes{"\033[90m", "\033[36m", "\033[1m",  "\033[34m",
                                                          "\033[0m",  "\033[33m", "\033[35m", "\033[1;31m",
                                                          "\033[31m", "\033[32m"};

  bool isOn_;
};

}  // namespace orv::tool
