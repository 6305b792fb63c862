// A guest's side of the invitation.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

#include "examples/invitation/outcome.hpp"
#include "examples/invitation/story.hpp"

namespace invitation {

// What a guest does instead of asking to join, to show that the host copes with it.
enum class Misbehaviour : std::uint8_t {
  none,
  garbage,  // sends bytes that are no message
  close,    // closes the connection
  stall,    // sends the first bytes of a message and no more
  freeze,   // stops its own process
};

// Asks the host at this path to connect, and, if the story has it approved, to join. Fails at the first thing
// that is not as it should be, or that does not come within the time limit.
Outcome<> playGuest(const std::string& socketPath, const story::Person& guest,
                    std::chrono::milliseconds timeLimit, Misbehaviour misbehaviour);

}  // namespace invitation
