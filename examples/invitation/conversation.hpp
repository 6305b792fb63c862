// One side's view of a connection: what it sends, receives and expects.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include <orv/delimited_stream.hpp>
#include <orv/envelope.hpp>
#include "examples/invitation/capture.hpp"
#include "examples/invitation/narrator.hpp"
#include "examples/invitation/outcome.hpp"
#include "examples/invitation/socket.hpp"

namespace invitation {

// The version in every envelope that is sent, and the only one that is accepted.
inline constexpr std::uint32_t protocolVersion = 1;

// Session messages over a socket, each behind its length. A message must arrive whole, or be taken by the
// peer, within the time limit, however many pieces it comes in. Failures name the peer and what was due.
class Conversation {
 public:
  // The narrator outlives the conversation, and so does the capture, if any.
  Conversation(Socket socket, std::string peer, std::chrono::milliseconds timeLimit, const Narrator& narrator,
               Capture* capture = nullptr);
  Conversation(const Conversation&) = delete;  // the reader refers to it
  Conversation& operator=(const Conversation&) = delete;

  template <class M>
  Outcome<> send(const M& payload) {
    auto message = orv::envelope::pack(payload);
    if (!message) return failure(std::string(describe(message.error())));
    message->setVersion(protocolVersion);
    narrator_.tell("sends", orv::envelope::nameOf(message->type()), inWords(payload));
    return sendMessage(*message);
  }

  // The next message's payload, which must be an M. What is received as it should be is captured.
  template <class M>
  Outcome<M> receive() {
    auto received = take<M>();
    if (!received) return received;
    if (auto kept = keepReceived(); !kept) return std::unexpected(kept.error());
    return received;
  }

  // Receives a payload that must equal this one.
  template <class M>
  Outcome<> receiveExactly(const M& expected) {
    const auto received = take<M>();
    if (!received) return std::unexpected(received.error());
    if (auto same = expectEqual(*received, expected); !same) return same;
    return keepReceived();
  }

  template <class M>
  Outcome<> expectEqual(const M& received, const M& expected) const {
    if (received == expected) return {};
    return failure("not what was expected of " + peer_ + "\nreceived " + std::string(M::protoMessageName) +
                   ":\n" + received.debugDescription() + "expected:\n" + expected.debugDescription());
  }

  // Sends no more, and fails unless the peer does the same.
  Outcome<> end();

  // For a side that misbehaves: bytes that need not be a message, and a wait for the peer to hang up, which
  // is longer than the peer waits.
  Outcome<> sendRaw(std::string_view bytes);
  Outcome<> awaitHangUp();

 private:
  Deadline deadline() const { return std::chrono::steady_clock::now() + timeLimit_; }
  Outcome<> sendMessage(const orv::SessionMessage& message);
  Outcome<orv::envelope::Payload> receivePayload(const std::string& due);
  Outcome<> keepReceived();

  template <class M>
  Outcome<M> take() {
    const std::string due = orv::envelope::nameOf(*orv::envelope::typeCarrying<M>);
    auto payload = receivePayload(due);
    if (!payload) return std::unexpected(payload.error());
    if (M* const received = std::get_if<M>(&*payload)) return std::move(*received);
    return fault("something else came", due);
  }

  Outcome<> receiveEnd(Deadline deadline);
  std::unexpected<Failure> fault(std::string_view what, std::string_view due) const;
  std::unexpected<Failure> fault(const orv::StreamError& error, std::string_view due) const;

  Socket socket_;
  std::string peer_;
  std::chrono::milliseconds timeLimit_;
  const Narrator& narrator_;
  Capture* capture_;
  Deadline readDeadline_;
  orv::SessionMessage received_;  // the last one
  Outcome<> readOutcome_;         // what the socket said of a read that failed
  orv::DelimitedReader reader_;
};

}  // namespace invitation
