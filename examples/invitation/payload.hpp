// How the two peers put a payload into a SessionMessage: `type` names the kind, `data` holds the payload's
// own encoding. The envelope leaves both to its users; another application could agree on something else.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <variant>

#include <orv/connection_request.hpp>
#include <orv/connection_response.hpp>
#include <orv/group.hpp>
#include <orv/join_request.hpp>
#include <orv/join_response.hpp>
#include <orv/session_message.hpp>
#include "examples/invitation/outcome.hpp"

namespace invitation {

inline constexpr std::uint32_t protocolVersion = 1;

// What a message may carry. ConnectionResponse itself has no fields: the answer is its Content.
using Payload = std::variant<orv::ConnectionRequest, orv::ConnectionResponse::Content, orv::JoinRequest,
                             orv::JoinResponse, orv::Group>;

template <class M>
inline constexpr orv::VessaSessionMessageType kindOf = orv::VessaSessionMessageType::unknown;
template <>
inline constexpr auto kindOf<orv::ConnectionRequest> = orv::VessaSessionMessageType::connectionRequest;
template <>
inline constexpr auto kindOf<orv::ConnectionResponse::Content> =
    orv::VessaSessionMessageType::connectionResponse;
template <>
inline constexpr auto kindOf<orv::JoinRequest> = orv::VessaSessionMessageType::joinRequest;
template <>
inline constexpr auto kindOf<orv::JoinResponse> = orv::VessaSessionMessageType::joinResponse;
template <>
inline constexpr auto kindOf<orv::Group> = orv::VessaSessionMessageType::groupMessage;

// "joinRequest", or the number of a kind that has no name.
std::string nameOf(orv::VessaSessionMessageType kind);

template <class M>
Outcome<orv::SessionMessage> pack(const M& payload) {
  static_assert(kindOf<M> != orv::VessaSessionMessageType::unknown, "this message travels in no envelope");
  auto bytes = payload.serialize();
  if (!bytes) return failure(std::string(describe(bytes.error())));
  orv::SessionMessage message;
  message.setVersion(protocolVersion);
  message.setType(kindOf<M>);
  message.setData(orv::ByteBuffer(*bytes));
  return message;
}

// Reads the payload whose kind the envelope names.
Outcome<Payload> unpack(const orv::SessionMessage& message);

}  // namespace invitation
