#include "examples/invitation/conversation.hpp"

#include <cstddef>
#include <span>

namespace invitation {

namespace {

// Far above every message of an invitation. A message that announces more is refused before it arrives.
constexpr std::size_t maximumMessageSize = std::size_t{64} << 10;

}  // namespace

Conversation::Conversation(Socket socket, std::string peer, std::chrono::milliseconds timeLimit,
                           const Narrator& narrator, Capture* capture)
    : socket_(std::move(socket)),
      peer_(std::move(peer)),
      timeLimit_(timeLimit),
      narrator_(narrator),
      capture_(capture),
      reader_(
          [this](std::span<std::byte> buffer) -> std::ptrdiff_t {
            const auto count = socket_.read(buffer, readDeadline_);
            if (count) return static_cast<std::ptrdiff_t>(*count);
            readOutcome_ = std::unexpected(count.error());
            return -1;
          },
          maximumMessageSize) {}

Outcome<> Conversation::end() {
  socket_.finishWriting();
  return receiveEnd(deadline());
}

Outcome<> Conversation::sendRaw(std::string_view bytes) { return socket_.write(bytes, deadline()); }

Outcome<> Conversation::awaitHangUp() { return receiveEnd(deadline() + timeLimit_); }

Outcome<> Conversation::receiveEnd(Deadline deadline) {
  readDeadline_ = deadline;
  const auto bytes = reader_.next();
  if (!bytes) return fault(bytes.error(), "the end");
  if (bytes->has_value()) return fault("another message came", "the end");
  return {};
}

Outcome<> Conversation::sendMessage(const orv::SessionMessage& message) {
  if (capture_ != nullptr) {
    if (auto kept = capture_->append(message); !kept) return kept;
  }
  std::string bytes;
  if (auto appended = orv::appendDelimited(message, bytes); !appended) {
    return failure(std::string(describe(appended.error())));
  }
  auto sent = socket_.write(bytes, deadline());
  if (!sent) return fault(sent.error().message, "to take a " + orv::envelope::nameOf(message.type()));
  return sent;
}

Outcome<> Conversation::keepReceived() {
  return capture_ == nullptr ? Outcome<>() : capture_->append(received_);
}

Outcome<orv::envelope::Payload> Conversation::receivePayload(const std::string& due) {
  readDeadline_ = deadline();
  const auto message = reader_.read<orv::SessionMessage>();
  if (!message) return fault(message.error(), due);
  if (!message->has_value()) return fault("the connection was closed", due);
  if (const std::uint32_t version = (*message)->version(); version != protocolVersion) {
    return fault("a message of version " + std::to_string(version) + " where version " +
                     std::to_string(protocolVersion) + " is spoken",
                 due);
  }
  auto payload = orv::envelope::unpack(**message);
  if (!payload) return fault(payload.error().message(), due);
  const auto words = std::visit([](const auto& carried) { return inWords(carried); }, *payload);
  narrator_.tell("receives", orv::envelope::nameOf((*message)->type()), words);
  received_ = **message;
  return std::move(*payload);
}

std::unexpected<Failure> Conversation::fault(std::string_view what, std::string_view due) const {
  return failure(std::string(what) + " (" + peer_ + ", " + std::string(due) + " was due)");
}

std::unexpected<Failure> Conversation::fault(const orv::StreamError& error, std::string_view due) const {
  if (error.cause == orv::StreamError::Cause::readFailed && !readOutcome_) {
    return fault(readOutcome_.error().message, due);
  }
  return fault(error.message(), due);
}

}  // namespace invitation
