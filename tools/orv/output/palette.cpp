#include "tools/orv/output/palette.hpp"

#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <charconv>
#include <cstdlib>

namespace orv::tool {

namespace {

// In the order of Palette::Colour: grey, cyan, bold, blue, plain, yellow, magenta, red, red, green.
constexpr std::array<std::string_view, 10> codes{"90", "36", "1", "34", "0", "33", "35", "1;31", "31", "32"};

bool wantsColour(int descriptor) {
  const char* const noColour = std::getenv("NO_COLOR");
  if (noColour != nullptr && *noColour != '\0') return false;
  const char* const terminal = std::getenv("TERM");
  return isTerminal(descriptor) && terminal != nullptr && std::string_view(terminal) != "dumb";
}

}  // namespace

bool isTerminal(int descriptor) { return ::isatty(descriptor) == 1; }

std::size_t terminalWidth(int descriptor) {
  winsize size{};
  if (!isTerminal(descriptor) || ::ioctl(descriptor, TIOCGWINSZ, &size) != 0) return 0;
  return size.ws_col;
}

Palette::Palette(ColourChoice choice, int descriptor)
    : isOn_(choice == ColourChoice::always ||
            (choice == ColourChoice::automatic && wantsColour(descriptor))) {}

void Palette::append(std::string& output, Colour colour, std::string_view text) const {
  if (text.empty()) return;
  start(output, colour);
  output += text;
  stop(output);
}

void Palette::startColour(std::string& output, Colour colour) {
  output += "\033[";
  output += codes[static_cast<std::size_t>(colour)];
  output += 'm';
}

}  // namespace orv::tool
