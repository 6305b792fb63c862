#include "tools/orv/output/palette.hpp"

#include <sys/ioctl.h>
#include <unistd.h>

#include <cstdlib>

namespace orv::tool {

namespace {

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
  output.append(start(colour)).append(text).append(stop());
}

}  // namespace orv::tool
