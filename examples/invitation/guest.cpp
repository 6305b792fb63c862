#include "examples/invitation/guest.hpp"

#include <csignal>
#include <string_view>

#include "examples/invitation/conversation.hpp"
#include "examples/invitation/sealing.hpp"

namespace invitation {

namespace {

using namespace std::string_view_literals;

// Asks to join, and answers once the host has approved.
Outcome<> join(const story::Person& guest, const orv::ByteBuffer& hostKey, const Narrator& narrator,
               Conversation& conversation) {
  const KeyPair keys;
  const auto sealer = Sealer::forGuest(keys, hostKey);
  if (!sealer) return std::unexpected(sealer.error());
  const auto body = story::joinRequest(guest);
  const auto plain = body.serialize();
  if (!plain) return failure(std::string(describe(plain.error())));
  narrator.tell("seals", "JoinRequest.Content", inWords(body));
  orv::JoinRequest request;
  request.setPublicKey(keys.publicKey());
  request.setEncryptedData(sealer->seal(*plain));
  if (auto asked = conversation.send(request); !asked) return asked;

  const auto response = conversation.receive<orv::JoinResponse>();
  if (!response) return std::unexpected(response.error());
  const auto opened = sealer->open(response->encryptedData());
  if (!opened) return std::unexpected(opened.error());
  const auto answer = orv::JoinResponse::Content::parse(*opened);
  if (!answer) return failure("malformed join body: " + answer.error().message());
  narrator.tell("opens", "JoinResponse.Content", inWords(*answer));
  return conversation.expectEqual(*answer, story::joinApproval(guest));
}

// Misbehaves as asked and waits for the host to close the connection.
Outcome<> misbehave(Misbehaviour misbehaviour, Conversation& conversation) {
  // A message of seven bytes whose field 3 announces five bytes, where one is left.
  constexpr auto malformedMessage = "\x07\x08\x01\x10\x01\x1A\x05\x41"sv;
  constexpr auto startOfMessage = malformedMessage.substr(0, 3);
  Outcome<> done;
  switch (misbehaviour) {
    case Misbehaviour::none: return done;
    case Misbehaviour::close: done = conversation.end(); break;
    case Misbehaviour::garbage: done = conversation.sendRaw(malformedMessage); break;
    case Misbehaviour::stall: done = conversation.sendRaw(startOfMessage); break;
    case Misbehaviour::freeze: std::raise(SIGSTOP); break;
  }
  if (done) done = conversation.awaitHangUp();
  if (!done) return done;
  return failure("misbehaved as told");
}

Outcome<> takePart(const story::Person& guest, const orv::ByteBuffer& hostKey, const Narrator& narrator,
                   Conversation& conversation) {
  if (auto joined = join(guest, hostKey, narrator, conversation); !joined) return joined;
  for (const orv::Group& event : story::membershipEvents(guest)) {
    if (auto followed = conversation.receiveExactly(event); !followed) return followed;
  }
  if (auto left = conversation.send(story::farewell()); !left) return left;
  return conversation.end();
}

}  // namespace

Outcome<> playGuest(const std::string& socketPath, const story::Person& guest,
                    std::chrono::milliseconds timeLimit, Misbehaviour misbehaviour) {
  const Narrator narrator{std::string(guest.name)};
  auto socket = Socket::connect(socketPath);
  if (!socket) return std::unexpected(socket.error());
  Conversation conversation(std::move(*socket), std::string(story::host.name), timeLimit, narrator);
  if (auto asked = conversation.send(story::connectionRequest(guest)); !asked) return asked;

  const bool isDenied = guest.name == story::ben.name;
  if (isDenied) {
    auto denied = conversation.receiveExactly(story::connectionDenial(guest));
    return denied ? conversation.end() : denied;
  }
  const auto answer = conversation.receive<orv::ConnectionResponse::Content>();
  if (!answer) return std::unexpected(answer.error());
  const orv::ByteBuffer& hostKey = answer->approved().invitationData();
  auto approved = conversation.expectEqual(*answer, story::connectionApproval(guest, hostKey));
  if (!approved) return approved;
  if (misbehaviour != Misbehaviour::none) return misbehave(misbehaviour, conversation);
  return takePart(guest, hostKey, narrator, conversation);
}

}  // namespace invitation
