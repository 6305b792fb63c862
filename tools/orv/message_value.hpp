// A message of a type that is known at run time only.
#pragma once

#include <cstddef>
#include <expected>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include <orv/decode_error.hpp>
#include <orv/encode_error.hpp>
#include <orv/json/document.hpp>
#include <orv/json/renderer.hpp>
#include "tools/orv/leaf.hpp"
#include "tools/orv/message_type.hpp"
#include "tools/orv/payload.hpp"

namespace orv::tool {

// What the tool does with a message once it is read.
class MessageValue {
 public:
  virtual ~MessageValue() = default;

  virtual std::string text() const = 0;
  virtual std::string json(json::RenderOptions options) const = 0;
  virtual std::expected<std::string, EncodeError> serialize() const = 0;
  // By the model's equality; false for another type, and for an envelope that is opened otherwise.
  virtual bool isEqualTo(const MessageValue& other) const = 0;
  // The fields of the whole tree one by one.
  virtual std::vector<Leaf> leaves() const = 0;
};

using AnyMessage = std::unique_ptr<MessageValue>;

// Reads a message of the type. An envelope is opened as the pairing says; an error in its payload has the
// payload's path, and its offset in the whole.
std::expected<AnyMessage, DecodeError> parseMessage(const MessageType& type, std::span<const std::byte> bytes,
                                                    const PayloadPairing& payloads);

// As parseMessage, from a JSON document. An envelope's data may be the payload as an object, or its bytes as
// a string.
std::expected<AnyMessage, json::Error> readJsonMessage(const MessageType& type, json::Value document,
                                                       const PayloadPairing& payloads);

}  // namespace orv::tool
