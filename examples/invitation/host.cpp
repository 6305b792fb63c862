#include "examples/invitation/host.hpp"

#include <memory>
#include <string>
#include <thread>

#include "examples/invitation/conversation.hpp"
#include "examples/invitation/lobby.hpp"
#include "examples/invitation/sealing.hpp"
#include "examples/invitation/story.hpp"

namespace invitation {

namespace {

// The events of a group are sent with a pause between them, so that the narration can be followed.
constexpr std::chrono::milliseconds betweenEvents{30};

class Host {
 public:
  Host(Listener listener, Capture& capture, std::chrono::milliseconds timeLimit)
      : lobby_(std::move(listener), timeLimit), capture_(capture), timeLimit_(timeLimit) {}

  Outcome<> letIn(const story::Person& guest) {
    const auto met = meet(guest);
    if (!met) return std::unexpected(met.error());
    Conversation& conversation = **met;
    auto answered = conversation.send(story::connectionApproval(guest, keys_.publicKey()));
    if (!answered) return answered;
    if (auto joined = letJoin(guest, conversation); !joined) return joined;
    for (const orv::Group& event : story::membershipEvents(guest)) {
      std::this_thread::sleep_for(betweenEvents);
      if (auto told = conversation.send(event); !told) return told;
    }
    if (auto left = conversation.receiveExactly(story::farewell()); !left) return left;
    return conversation.end();
  }

  Outcome<> turnAway(const story::Person& guest) {
    const auto met = meet(guest);
    if (!met) return std::unexpected(met.error());
    Conversation& conversation = **met;
    if (auto answered = conversation.send(story::connectionDenial(guest)); !answered) return answered;
    return conversation.end();
  }

  void tellOfCapture() const {
    narrator_.tell("wrote", std::to_string(capture_.size()) + " messages", "to " + capture_.path());
  }

 private:
  // Waits for the guest, who is known by its request. Everybody else is turned away, and holds up nobody.
  Outcome<std::unique_ptr<Conversation>> meet(const story::Person& guest) {
    const Deadline deadline = std::chrono::steady_clock::now() + timeLimit_;
    for (;;) {
      auto socket = lobby_.next(deadline);
      if (!socket) return failure(socket.error().message + " (" + std::string(guest.name) + " was due)");
      auto conversation = std::make_unique<Conversation>(std::move(*socket), std::string(guest.name),
                                                         timeLimit_, narrator_, &capture_);
      const auto asked = conversation->receiveExactly(story::connectionRequest(guest));
      if (asked) return conversation;
      // The first line says it.
      const std::string& reason = asked.error().message;
      narrator_.complain("turned a stranger away: " + reason.substr(0, reason.find('\n')));
    }
  }

  Outcome<> letJoin(const story::Person& guest, Conversation& conversation) {
    const auto request = conversation.receive<orv::JoinRequest>();
    if (!request) return std::unexpected(request.error());
    const auto sealer = Sealer::forHost(keys_, request->publicKey());
    if (!sealer) return std::unexpected(sealer.error());
    const auto opened = sealer->open(request->encryptedData());
    if (!opened) return std::unexpected(opened.error());
    const auto body = orv::JoinRequest::Content::parse(*opened);
    if (!body) return failure("malformed join body: " + body.error().message());
    narrator_.tell("opens", "JoinRequest.Content", inWords(*body));
    if (auto same = conversation.expectEqual(*body, story::joinRequest(guest)); !same) return same;

    const auto approval = story::joinApproval(guest);
    const auto plain = approval.serialize();
    if (!plain) return failure(std::string(describe(plain.error())));
    narrator_.tell("seals", "JoinResponse.Content", inWords(approval));
    orv::JoinResponse response;
    response.setEncryptedData(sealer->seal(*plain));
    return conversation.send(response);
  }

  Lobby lobby_;
  Capture& capture_;
  std::chrono::milliseconds timeLimit_;
  Narrator narrator_{std::string(story::host.name)};
  KeyPair keys_;
};

}  // namespace

Outcome<> playHost(Listener listener, Capture& capture, std::chrono::milliseconds timeLimit) {
  Host host(std::move(listener), capture, timeLimit);
  if (auto played = host.letIn(story::anna); !played) return played;
  if (auto played = host.turnAway(story::ben); !played) return played;
  host.tellOfCapture();
  return {};
}

}  // namespace invitation
