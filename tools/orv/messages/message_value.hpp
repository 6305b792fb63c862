// A message of a type that is known at run time only.
#pragma once

#include <cstddef>
#include <expected>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include <orv/compare.hpp>
#include <orv/decode_error.hpp>
#include <orv/encode_error.hpp>
#include <orv/json/document.hpp>
#include <orv/json/renderer.hpp>
#include <orv/text_renderer.hpp>
#include "tools/orv/messages/message_type.hpp"

namespace orv::tool {

// What the tool does with a message once it is read.
class MessageValue {
 public:
  virtual ~MessageValue() = default;

  // As encode reads it, unless secrets are hidden.
  virtual std::string text(TextStyle style) const = 0;
  virtual std::string json(json::RenderOptions options) const = 0;
  virtual std::expected<std::string, EncodeError> serialize() const = 0;
  virtual std::vector<compare::Leaf> leaves() const = 0;
};

using OwnedMessage = std::unique_ptr<MessageValue>;

// Reads a message of the type. An envelope is opened as the pairing says; an error in its payload has the
// payload's path, and its offset in the whole.
std::expected<OwnedMessage, DecodeError> parseMessage(const MessageType& type,
                                                      std::span<const std::byte> bytes,
                                                      const PayloadPairing& payloads);

// As parseMessage, from a JSON document. An envelope's data may be the payload as an object, or its bytes as
// a string.
std::expected<OwnedMessage, json::Error> readJsonMessage(const MessageType& type, json::Value document,
                                                         const PayloadPairing& payloads);

}  // namespace orv::tool
