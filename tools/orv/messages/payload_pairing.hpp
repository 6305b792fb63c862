// Which message the data of an envelope is shown as.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include <orv/session_message.hpp>
#include "tools/orv/messages/message_type.hpp"

namespace orv::tool {

// The pairing of orv::envelope, with what the command line changes in it.
class PayloadPairing {
 public:
  // A pairing that leaves data as bytes.
  static PayloadPairing closed() {
    PayloadPairing pairing;
    pairing.leaveClosed();
    return pairing;
  }

  // None for envelopes whose data stays bytes.
  const MessageType* payloadOf(VessaSessionMessageType type) const;

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

// What stands in an envelope's encoding, as far as that is well-formed. Of several fields of one number the
// last counts.
struct EnvelopeOutline {
  VessaSessionMessageType type;
  std::optional<std::span<const std::byte>> data;
};
EnvelopeOutline outlineOf(std::span<const std::byte> envelope);

}  // namespace orv::tool
