// The MessageValue of one message type.
#pragma once

#include <expected>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <orv/json.hpp>
#include "tools/orv/messages/message_value.hpp"

namespace orv::tool {

template <class M>
class TypedValue final : public MessageValue {
 public:
  explicit TypedValue(M message) : message_(std::move(message)) {}

  std::string text() const override { return message_.debugDescription(); }
  std::string json(json::RenderOptions options) const override { return json::render(message_, options); }
  std::expected<std::string, EncodeError> serialize() const override { return message_.serialize(); }
  std::vector<compare::Difference> differencesTo(const MessageValue& other) const override {
    const auto* const same = dynamic_cast<const TypedValue*>(&other);
    return same != nullptr ? compare::differences(message_, same->message_)
                           : compare::differencesOfLeaves(leaves(), other.leaves());
  }
  std::vector<compare::Leaf> leaves() const override { return compare::LeafCollector::collect(message_); }

 private:
  M message_;
};

template <class M>
OwnedMessage valueOf(M message) {
  return std::make_unique<TypedValue<M>>(std::move(message));
}

using ReadJson = std::expected<OwnedMessage, json::Error>(json::Value);

template <class M>
std::expected<OwnedMessage, json::Error> readTyped(json::Value document) {
  auto message = json::read<M>(document);
  if (!message) return std::unexpected(std::move(message.error()));
  return valueOf(std::move(*message));
}

// Both are in envelope_value.cpp, away from the plain types, because each makes as much code as all of those.
std::expected<OwnedMessage, DecodeError> openEnvelope(const SessionMessage& envelope,
                                                      const MessageType& payload);
std::expected<OwnedMessage, json::Error> readOpenedJson(const MessageType& payload, json::Value document);

}  // namespace orv::tool
