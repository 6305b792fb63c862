// The host's side of the invitation.
#pragma once

#include <chrono>

#include "examples/invitation/capture.hpp"
#include "examples/invitation/outcome.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

// Lets the first guest in, turns the second away, and records both in the capture. Fails at the first thing
// that is not as it should be, or that does not come within the time limit.
Outcome<> playHost(Listener listener, Capture& capture, std::chrono::milliseconds timeLimit);

}  // namespace invitation
