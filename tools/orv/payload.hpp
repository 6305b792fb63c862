// Which message the data of an envelope holds.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <map>
#include <span>
#include <string>
#include <string_view>

#include <orv/session_message.hpp>
#include "tools/orv/message_type.hpp"

namespace orv::tool {

// The pairing of an envelope's type and the message in its data. The protocol goes by the names alone; that a
// connectionResponse carries a ConnectionResponse.Content, which holds the answer, is this tool's reading.
class PayloadPairing {
 public:
  // None for envelopes whose data stays bytes.
  const MessageType* payloadOf(VessaSessionMessageType type) const;
  const MessageType* payloadOf(const SessionMessage& envelope) const { return payloadOf(envelope.type()); }

  // From now on data is bytes, whatever the type.
  void leaveClosed() { opens_ = false; }

  // "TYPE" for the payload of every envelope, "KIND=TYPE" for those of one type, which is given by its name
  // or its number. The error says what is wrong with it.
  std::expected<void, std::string> override(std::string_view pairing);

 private:
  bool opens_ = true;
  const MessageType* forAll_ = nullptr;
  std::map<std::int64_t, const MessageType*> forKind_;
};

// The field of an envelope that holds its payload.
inline constexpr auto dataNumber =
    static_cast<std::uint32_t>(*SessionMessage::_protobuf_nameMap().number("data"));

// Where the payload stands in an envelope's encoding: in the last data field, which is the one that counts.
// Looks as far as the encoding is well-formed; empty, and at its beginning, when there is none.
std::span<const std::byte> payloadBytes(std::span<const std::byte> envelope);

// The kind that the pairing above gives this payload, if any.
std::string_view kindCarrying(const MessageType& payload);

}  // namespace orv::tool
