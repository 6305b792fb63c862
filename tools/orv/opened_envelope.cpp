#include "tools/orv/opened_envelope.hpp"

#include "tools/orv/typed_value.hpp"

namespace orv::tool {

namespace {

using Open = std::expected<AnyMessage, DecodeError>(const SessionMessage&);
using ReadJson = std::expected<AnyMessage, json::Error>(json::Value);

constexpr auto openAs = functionPerType<Open>([]<class Payload>() -> Open* {
  return [](const SessionMessage& envelope) -> std::expected<AnyMessage, DecodeError> {
    auto payload = Payload::parse(envelope.data().bytes());
    if (!payload) return std::unexpected(payload.error());
    return valueOf(OpenedEnvelope<Payload>(envelope, std::move(*payload)));
  };
});

constexpr auto readJsonAs = functionPerType<ReadJson>(
    []<class Payload>() -> ReadJson* { return &readTyped<OpenedEnvelope<Payload>>; });

}  // namespace

std::expected<AnyMessage, DecodeError> openEnvelope(const SessionMessage& envelope,
                                                    const MessageType& payload) {
  return openAs[payload.index](envelope);
}

std::expected<AnyMessage, json::Error> readOpenedJson(const MessageType& payload, json::Value document) {
  return readJsonAs[payload.index](document);
}

}  // namespace orv::tool
