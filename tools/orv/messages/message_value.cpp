#include "tools/orv/messages/message_value.hpp"

#include <cstdint>
#include <optional>
#include <utility>

#include "tools/orv/messages/typed_value.hpp"

namespace orv::tool {

namespace {

using Parse = std::expected<OwnedMessage, DecodeError>(std::span<const std::byte>);

constexpr auto parseAs = functionPerType<Parse>([]<class M>() -> Parse* {
  return [](std::span<const std::byte> bytes) -> std::expected<OwnedMessage, DecodeError> {
    auto message = M::parse(bytes);
    if (!message) return std::unexpected(message.error());
    return valueOf(std::move(*message));
  };
});

constexpr auto readJsonAs = functionPerType<ReadJson>([]<class M>() -> ReadJson* { return &readTyped<M>; });

// The payload that a document's "type" names.
const MessageType* payloadOf(json::Value envelope, const PayloadPairing& payloads) {
  const auto names = VessaSessionMessageType::_protobuf_nameMap();
  std::optional<std::int64_t> kind;
  if (const auto type = envelope.find("type")) {
    if (type->kind() == json::Value::Kind::text) kind = names.number(type->text());
    if (type->kind() == json::Value::Kind::number) kind = type->integer();
  }
  return payloads.payloadOf(kind ? VessaSessionMessageType(*kind) : VessaSessionMessageType());
}

}  // namespace

std::expected<OwnedMessage, DecodeError> parseMessage(const MessageType& type,
                                                      std::span<const std::byte> bytes,
                                                      const PayloadPairing& payloads) {
  if (!type.isEnvelope()) return parseAs[type.index](bytes);
  auto envelope = SessionMessage::parse(bytes);
  if (!envelope) return std::unexpected(envelope.error());
  const MessageType* const payload = envelope->hasData() ? payloads.payloadOf(envelope->type()) : nullptr;
  if (payload == nullptr) return valueOf(std::move(*envelope));
  auto opened = openEnvelope(*envelope, *payload);
  if (!opened) {
    opened.error().offset += static_cast<std::size_t>(outlineOf(bytes).data->data() - bytes.data());
  }
  return opened;
}

std::expected<OwnedMessage, json::Error> readJsonMessage(const MessageType& type, json::Value document,
                                                         const PayloadPairing& payloads) {
  const bool isEnvelope = type.isEnvelope() && document.kind() == json::Value::Kind::object;
  const auto data = isEnvelope ? document.find("data") : std::nullopt;
  if (!data || data->kind() != json::Value::Kind::object) return readJsonAs[type.index](document);
  const MessageType* const payload = payloadOf(document, payloads);
  if (payload != nullptr) return readOpenedJson(*payload, document);
  // Any other mistake in the document is told first.
  if (auto read = readOpenedJson(typeOf<SessionMessage>(), document);
      !read && !read.error().path.starts_with("$.data"))
    return read;
  return std::unexpected(
      json::Error{.reason = "an object, but no \"type\" says of which message", .path = "$.data"});
}

}  // namespace orv::tool
