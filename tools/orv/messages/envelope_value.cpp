// Envelopes with their payloads as messages.
#include <orv/envelope.hpp>
#include <orv/instantiate.hpp>
#include "tools/orv/messages/typed_value.hpp"

namespace orv::tool {

namespace {

using Open = std::expected<OwnedMessage, DecodeError>(const SessionMessage&);

constexpr auto openAs = functionPerType<Open>([]<class Payload>() -> Open* {
  return [](const SessionMessage& envelope) -> std::expected<OwnedMessage, DecodeError> {
    auto payload = Payload::parse(envelope.data().bytes());
    if (!payload) return std::unexpected(payload.error());
    return valueOf(envelope::Envelope<Payload>(envelope, std::move(*payload)));
  };
});

constexpr auto readJsonAs = functionPerType<ReadJson>(
    []<class Payload>() -> ReadJson* { return &readTyped<envelope::Envelope<Payload>>; });

}  // namespace

std::expected<OwnedMessage, DecodeError> openEnvelope(const SessionMessage& envelope,
                                                      const MessageType& payload) {
  return openAs[payload.index](envelope);
}

std::expected<OwnedMessage, json::Error> readOpenedJson(const MessageType& payload, json::Value document) {
  return readJsonAs[payload.index](document);
}

}  // namespace orv::tool
