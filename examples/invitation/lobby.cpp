#include "examples/invitation/lobby.hpp"

#include <algorithm>
#include <array>
#include <cstddef>
#include <span>

#include <orv/delimited_stream.hpp>

namespace invitation {

namespace {

// Half a message leaves a connection readable, so that there is no event to wait for.
constexpr std::chrono::milliseconds betweenLooks{10};
// More than anybody's first message.
constexpr std::size_t longestStart = 4096;

// Whether reading a message from the connection will not wait.
bool canBeRead(const Socket& socket) {
  std::array<std::byte, longestStart> start;
  if (socket.peerHasFinished()) return true;
  const auto count = socket.peek(start);
  if (!count) return true;
  if (!*count) return false;
  auto left = std::span(start).first(**count);
  if (left.empty() || left.size() == start.size()) return true;
  orv::DelimitedReader reader([&](std::span<std::byte> room) {
    const auto taken = left.first(std::min(left.size(), room.size()));
    std::ranges::copy(taken, room.begin());
    left = left.subspan(taken.size());
    return static_cast<std::ptrdiff_t>(taken.size());
  });
  const auto message = reader.next();
  return message.has_value() || message.error().cause != orv::StreamError::Cause::truncated;
}

}  // namespace

Outcome<Socket> Lobby::next(Deadline deadline) {
  for (;;) {
    const auto now = std::chrono::steady_clock::now();
    const auto found = std::ranges::find_if(waiting_, [&](const Waiting& waiting) {
      return waiting.deadline <= now || canBeRead(waiting.socket);
    });
    if (found != waiting_.end()) {
      Socket socket = std::move(found->socket);
      if (found->deadline <= now) socket.finishReading();
      waiting_.erase(found);
      return socket;
    }
    const Deadline nextLook = waiting_.empty() ? deadline : std::min(deadline, now + betweenLooks);
    auto accepted = listener_.accept(nextLook);
    if (accepted) {
      waiting_.push_back({std::move(*accepted), now + timeLimit_});
    } else if (!accepted.error().isTimeout || nextLook == deadline) {
      return accepted;
    }
  }
}

}  // namespace invitation
