// The MessageValue of one message type.
#pragma once

#include <expected>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <orv/json.hpp>
#include "tools/orv/message_value.hpp"

namespace orv::tool {

template <class M>
class TypedValue final : public MessageValue {
 public:
  explicit TypedValue(M message) : message_(std::move(message)) {}

  std::string text() const override { return message_.debugDescription(); }
  std::string json(json::RenderOptions options) const override { return json::render(message_, options); }
  std::expected<std::string, EncodeError> serialize() const override { return message_.serialize(); }
  bool isEqualTo(const MessageValue& other) const override {
    const auto* const same = dynamic_cast<const TypedValue*>(&other);
    return same != nullptr && message_ == same->message_;
  }
  std::vector<Leaf> leaves() const override { return LeafCollector::collect(message_); }

 private:
  M message_;
};

template <class M>
AnyMessage valueOf(M message) {
  return std::make_unique<TypedValue<M>>(std::move(message));
}

template <class M>
std::expected<AnyMessage, json::Error> readTyped(json::Value document) {
  auto message = json::read<M>(document);
  if (!message) return std::unexpected(std::move(message.error()));
  return valueOf(std::move(*message));
}

// Both are in opened_envelope.cpp, away from the plain types, because each makes as much code as all of
// those.
std::expected<AnyMessage, DecodeError> openEnvelope(const SessionMessage& envelope,
                                                    const MessageType& payload);
std::expected<AnyMessage, json::Error> readOpenedJson(const MessageType& payload, json::Value document);

}  // namespace orv::tool
