#include "tools/orv/messages/message_value.hpp"

#include <array>
#include <cstdint>
#include <optional>
#include <utility>

#include <orv/envelope.hpp>
#include <orv/instantiate.hpp>
#include <orv/json.hpp>

namespace orv::tool {

namespace {

using envelope::Envelope;

template <class M>
class TypedValue final : public MessageValue {
 public:
  explicit TypedValue(M message) : message_(std::move(message)) {}

  std::string text(TextStyle style) const override {
    std::string text;
    style.isReversible = !style.hidesSecrets;
    TextRenderer renderer(text, style);
    (void)message_.traverse(renderer);
    return text;
  }
  std::string json(json::RenderOptions options) const override { return json::render(message_, options); }
  std::expected<std::string, EncodeError> serialize() const override { return message_.serialize(); }
  std::vector<compare::Leaf> leaves() const override { return compare::LeafCollector::collect(message_); }

 private:
  M message_;
};

template <class M, class E>
std::expected<OwnedMessage, E> valueOf(std::expected<M, E> message) {
  if (!message) return std::unexpected(std::move(message.error()));
  return std::make_unique<TypedValue<M>>(std::move(*message));
}

// What is done by type.
struct TypeFunctions {
  std::expected<OwnedMessage, DecodeError> (*parse)(std::span<const std::byte> bytes);
  std::expected<OwnedMessage, json::Error> (*readJson)(json::Value document);
  // An envelope with a payload of the type in its place.
  std::expected<OwnedMessage, DecodeError> (*open)(const SessionMessage& envelope);
  std::expected<OwnedMessage, json::Error> (*readOpenedJson)(json::Value document);
};

// In the order of MessageType::index.
constexpr auto functions = [] {
  std::array<TypeFunctions, AllMessages::size> list{};
  std::size_t index = 0;
  AllMessages::forEach([&]<class M>() {
    list[index++] = {
        .parse = [](std::span<const std::byte> bytes) { return valueOf(M::parse(bytes)); },
        .readJson = [](json::Value document) { return valueOf(json::read<M>(document)); },
        .open = [](const SessionMessage& envelope) -> std::expected<OwnedMessage, DecodeError> {
          auto payload = M::parse(envelope.data().bytes());
          if (!payload) return std::unexpected(payload.error());
          return std::make_unique<TypedValue<Envelope<M>>>(Envelope<M>(envelope, std::move(*payload)));
        },
        .readOpenedJson = [](json::Value document) { return valueOf(json::read<Envelope<M>>(document)); }};
  });
  return list;
}();

const TypeFunctions& functionsOf(const MessageType& type) { return functions[type.index]; }

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
  if (!type.isEnvelope()) return functionsOf(type).parse(bytes);
  auto envelope = SessionMessage::parse(bytes);
  const bool hasData = envelope && envelope->hasData();
  const MessageType* const payload = hasData ? payloads.payloadOf(envelope->type()) : nullptr;
  if (payload == nullptr) return valueOf(std::move(envelope));
  auto opened = functionsOf(*payload).open(*envelope);
  if (!opened) {
    opened.error().offset += static_cast<std::size_t>(outlineOf(bytes).data->data() - bytes.data());
  }
  return opened;
}

std::expected<OwnedMessage, json::Error> readJsonMessage(const MessageType& type, json::Value document,
                                                         const PayloadPairing& payloads) {
  const bool isEnvelope = type.isEnvelope() && document.kind() == json::Value::Kind::object;
  const auto data = isEnvelope ? document.find("data") : std::nullopt;
  if (!data || data->kind() != json::Value::Kind::object) return functionsOf(type).readJson(document);
  const MessageType* const payload = payloadOf(document, payloads);
  if (payload != nullptr) return functionsOf(*payload).readOpenedJson(document);
  // Any other mistake in the document is told first.
  if (auto read = functionsOf(type).readOpenedJson(document);
      !read && !read.error().path.starts_with("$.data"))
    return read;
  return std::unexpected(
      json::Error{.reason = "an object, but no \"type\" says of which message", .path = "$.data"});
}

}  // namespace orv::tool
