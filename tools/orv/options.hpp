// What the command line asks for.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "tools/orv/messages/message_type.hpp"
#include "tools/orv/messages/selection.hpp"

namespace orv::tool {

// The forms that a message can be given, or shown, in.
enum class Format : std::uint8_t { binary, hex, base64, text, json, html };

// As the options spell it.
constexpr std::string_view nameOf(Format format) {
  constexpr std::array<std::string_view, 6> names{"binary", "hex", "base64", "text", "json", "html"};
  return names[static_cast<std::size_t>(format)];
}

// Whether the format spells out the binary encoding, byte by byte.
constexpr bool isBytes(Format format) { return format <= Format::base64; }

enum class ColourChoice : std::uint8_t { automatic, always, never };

struct Options {
  const MessageType* type = &typeOf<SessionMessage>();
  PayloadPairing payloads;
  Selection selection;
  std::map<std::string, const MessageType*, std::less<>> innerTypes;  // of bytes fields, by their paths
  std::optional<Format> from;  // none: to be seen from the input, as one of these
  std::span<const Format> possibleFormats;
  std::optional<Format> to;  // none: the command writes no messages
  bool isDelimited = false;
  bool keepsGoing = false;
  bool showsUnknownFields = false;
  bool showsDefaults = false;
  bool hidesSecrets = false;
  bool comparesEncodings = false;
  std::vector<std::string> ignored;  // paths of fields
  bool isQuiet = false;
  bool isVerbose = false;
  // A message takes several times its size in memory, up to about sixty times where it is nothing but empty
  // members.
  std::size_t maximumSize = std::size_t{16} << 20;
  ColourChoice colour = ColourChoice::automatic;
  std::vector<std::string> files;  // or the names of message types or of a command, for types and help
  std::optional<std::string> output;
};

}  // namespace orv::tool
