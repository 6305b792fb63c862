#include "examples/invitation/payload.hpp"

namespace invitation {

namespace {

template <class M>
Outcome<Payload> parseAs(const orv::ByteBuffer& data) {
  auto payload = M::parse(data.bytes());
  if (!payload) return failure("malformed payload: " + payload.error().message());
  return Payload(std::move(*payload));
}

// Tries the alternatives of Payload one after the other.
template <class... Ms>
Outcome<Payload> unpackOneOf(const orv::SessionMessage& message, const std::variant<Ms...>*) {
  Outcome<Payload> payload = failure("a message of the kind " + nameOf(message.type()) + " carries nothing");
  (void)((message.type() == kindOf<Ms> && (payload = parseAs<Ms>(message.data()), true)) || ...);
  return payload;
}

}  // namespace

std::string nameOf(orv::VessaSessionMessageType kind) {
  const auto name = orv::VessaSessionMessageType::_protobuf_nameMap().name(kind.rawValue());
  return name ? std::string(*name) : std::to_string(kind.rawValue());
}

Outcome<Payload> unpack(const orv::SessionMessage& message) {
  if (message.version() != protocolVersion) {
    return failure("a message of version " + std::to_string(message.version()) + " where version " +
                   std::to_string(protocolVersion) + " is spoken");
  }
  return unpackOneOf(message, static_cast<const Payload*>(nullptr));
}

}  // namespace invitation
