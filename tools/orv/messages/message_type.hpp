// The message types by name, and which of them the data of an envelope is shown as.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include <orv/all_messages.hpp>
#include <orv/session_message.hpp>
#include <orv/wire_reader.hpp>

namespace orv::tool {

// One of the types in AllMessages. There is one object per type: two pointers are equal when the types are.
struct MessageType {
  std::size_t index;  // in AllMessages
  const MessageDescriptor* descriptor;

  std::string_view fullName() const { return descriptor->fullName; }
  // Without the package: "Group.MemberAdded".
  std::string_view shortName() const { return fullName().substr(fullName().find('.') + 1); }
  bool isEnvelope() const { return descriptor == &SessionMessage::descriptor(); }
};

std::span<const MessageType> allMessageTypes();

// What values of the type are called: "uint32".
std::string_view nameOf(ValueType type);

const MessageType& typeOf(const MessageDescriptor& descriptor);
template <class M>
const MessageType& typeOf() {
  return typeOf(M::descriptor());
}

// Finds a type by its full name, its name without the package, or the last word of it where that is one
// type's alone. The error says what is wrong with the name.
std::expected<const MessageType*, std::string> findMessageType(std::string_view name);

// A type of envelopes by its name or its number.
std::optional<std::int64_t> kindNumber(std::string_view kind);

// The pairing of orv::envelope, with what the command line changes in it.
class PayloadPairing {
 public:
  // A pairing that leaves data as bytes.
  static PayloadPairing closed() {
    PayloadPairing pairing;
    pairing.leaveClosed();
    return pairing;
  }

  bool isClosed() const { return !opens_; }
  bool hasOverrides() const { return forOthers_ != nullptr || !forKind_.empty(); }

  // None for envelopes whose data stays bytes.
  const MessageType* payloadOf(VessaSessionMessageType type) const;

  // From now on data is bytes, whatever the type.
  void leaveClosed() { opens_ = false; }

  // "KIND=TYPE" for the payloads of one type of envelopes, which is given by its name or its number, "TYPE" for
  // those of all types that have none. The error says what is wrong with it.
  std::expected<void, std::string> override(std::string_view pairing);

 private:
  bool opens_ = true;
  const MessageType* forOthers_ = nullptr;
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
