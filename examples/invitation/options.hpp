// What the command line asks for.
#pragma once

#include <chrono>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

#include "examples/invitation/guest.hpp"
#include "examples/invitation/outcome.hpp"

namespace invitation {

struct Options {
  enum class Part : std::uint8_t { all, host, guest };

  Part part = Part::all;
  std::string socketPath;  // of a host or a guest on its own
  story::Person guest = story::anna;
  std::string capturePath = "invitation.capture";
  std::chrono::milliseconds timeLimit{5000};
  Misbehaviour misbehaviour = Misbehaviour::none;
};

inline constexpr std::string_view usage =
    "usage: invitation [options]                       both sides, in processes of their own\n"
    "       invitation [options] host SOCKET           the host alone\n"
    "       invitation [options] guest SOCKET NAME     a guest alone: anna, then ben\n"
    "\n"
    "  --capture FILE       where the host records the session (invitation.capture)\n"
    "  --time-limit SECONDS how long a message may take to arrive (5)\n"
    "  --misbehave HOW      what anna does instead of joining: garbage, close, stall or freeze\n"
    "  --help               shows this text\n";

Outcome<Options> parseOptions(std::span<const char* const> arguments);

}  // namespace invitation
