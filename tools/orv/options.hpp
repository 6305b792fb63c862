// What the command line asks for.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "tools/orv/failure.hpp"
#include "tools/orv/format.hpp"
#include "tools/orv/message_type.hpp"
#include "tools/orv/payload.hpp"
#include "tools/orv/terminal.hpp"

namespace orv::tool {

enum class Command : std::uint8_t { decode, encode, inspect, convert, diff, identify, types, schema };

struct Options {
  Command command = Command::decode;
  const MessageType* type = &typeOf<SessionMessage>();
  PayloadPairing payloads;
  std::optional<Format> from;  // none: the command's default
  std::optional<Format> to;
  bool isDelimited = false;
  bool showsUnknownFields = false;
  bool comparesEncodings = false;
  bool isQuiet = false;
  // A message takes several times its size in memory, up to about sixty times where it is nothing but empty
  // members.
  std::size_t maximumSize = std::size_t{16} << 20;
  ColourChoice colour = ColourChoice::automatic;
  std::vector<std::string> files;  // or the names of message types, for the command types
  std::optional<std::string> output;
};

// Text that was asked for in place of work: help, the version, the manual page.
struct Answer {
  std::string text;
};

std::variant<Options, Answer, Failure> parseCommandLine(int argumentCount, const char* const* arguments);

}  // namespace orv::tool
