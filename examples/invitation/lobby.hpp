// Where connections wait until they have said who they are.
#pragma once

#include <chrono>
#include <vector>

#include "examples/invitation/outcome.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

// Anyone may connect, and may then stall. The lobby takes connections from a listener and gives them out in the order
// in which they can be talked to without waiting for them, so that nobody holds up anybody else.
class Lobby {
 public:
  // A connection may keep silent for the time limit.
  Lobby(Listener listener, std::chrono::milliseconds timeLimit)
      : listener_(std::move(listener)), timeLimit_(timeLimit) {}

  // The next connection whose first message is there, or never will be: because it is malformed, the peer has closed
  // its end, or the connection has been silent for too long. Fails at the deadline.
  Outcome<Socket> next(Deadline deadline);

 private:
  struct Waiting {
    Socket socket;
    Deadline deadline;
  };

  Listener listener_;
  std::chrono::milliseconds timeLimit_;
  std::vector<Waiting> waiting_;
};

}  // namespace invitation
