// What can be read of malformed messages.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>

#include "tools/orv/messages/message_value.hpp"

namespace orv::tool {

// A message with the fields that stand before an error.
struct Salvage {
  OwnedMessage message;
  // The path of the text or bytes of which only the start was there, and is taken: "data.member.handle". Empty
  // where there are none.
  std::string cut;
};

// Whether texts and bytes that end early are taken: what stands in them may be what was to follow.
enum class CutFields : bool { leaveOut, take };

// Reads a message up to its error, and that of a payload up to the error there. None if nothing that the type knows
// stands before it. Takes memory in proportion to the bytes.
std::optional<Salvage> salvage(const MessageType& type, std::span<const std::byte> bytes,
                               const PayloadPairing& payloads, CutFields cut);

}  // namespace orv::tool
