// Payloads in their envelopes.
#pragma once

#include <algorithm>
#include <cstdint>
#include <expected>
#include <iosfwd>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <utility>
#include <variant>

#include <orv/connection_request.hpp>
#include <orv/connection_response.hpp>
#include <orv/group.hpp>
#include <orv/internal/printing.hpp>
#include <orv/internal/standard.hpp>
#include <orv/join_request.hpp>
#include <orv/join_response.hpp>
#include <orv/session_message.hpp>

namespace orv::inline v0::envelope {

// An envelope of this type carries a P.
template <class P>
struct Pairing {
  using Payload = P;
  VessaSessionMessageType type;
};

// The protocol leaves it to the peers what an envelope carries. This pairing follows the names; that a
// connectionResponse carries a ConnectionResponse.Content, which holds the answer, is this component's reading.
inline constexpr std::tuple pairings{
    Pairing<JoinRequest>{VessaSessionMessageType::joinRequest},
    Pairing<JoinResponse>{VessaSessionMessageType::joinResponse},
    Pairing<ConnectionRequest>{VessaSessionMessageType::connectionRequest},
    Pairing<ConnectionResponse::Content>{VessaSessionMessageType::connectionResponse},
    Pairing<Group>{VessaSessionMessageType::groupMessage},
};

// Any of the payloads.
using Payload = decltype(std::apply(
    []<class... Pairings>(Pairings...) { return std::variant<typename Pairings::Payload...>(); }, pairings));

// The type of the envelopes that carry an M; none for a message that no envelope carries.
template <class M>
inline constexpr std::optional<VessaSessionMessageType> typeCarrying = std::apply(
    []<class... Pairings>(const Pairings&... rows) {
      std::optional<VessaSessionMessageType> type;
      ((std::is_same_v<M, typename Pairings::Payload> ? void(type = rows.type) : void()), ...);
      return type;
    },
    pairings);

template <class M>
concept Carried = typeCarrying<M>
.has_value();

// The payload of an envelope of this type; none for a type that is not paired.
constexpr const MessageDescriptor* payloadOf(VessaSessionMessageType type) {
  return std::apply(
      [&]<class... Pairings>(const Pairings&... rows) {
        const MessageDescriptor* payload = nullptr;
        ((rows.type == type ? void(payload = &Pairings::Payload::descriptor()) : void()), ...);
        return payload;
      },
      pairings);
}

// A SessionMessage with a P as a message in place of its bytes. Both are encoded alike, so that everything
// that works on messages shows, reads, compares and writes the payload in its place: serialize() writes
// envelope and payload in one pass. P is one of the payloads above; for other messages include
// <orv/instantiate.hpp>.
template <class P>
class Envelope final : public Message<Envelope<P>> {
 public:
  static constexpr std::string_view protoMessageName = SessionMessage::protoMessageName;

  Envelope() noexcept {}
  explicit Envelope(P payload) requires Carried<P> : type_(typeCarrying<P>), data_(std::move(payload)) {}
  // Version, type and unknown fields from the envelope, whose data is left aside.
  Envelope(const SessionMessage& envelope, P payload) : data_(std::move(payload)) {
    if (envelope.hasVersion()) version_ = envelope.version();
    if (envelope.hasType()) type_ = envelope.type();
    this->setUnknownFields(envelope.unknownFields());
  }

  void setVersion(std::uint32_t value) { version_ = value; }

 private:
  friend Message<Envelope>;  // the rules read the table
  std::optional<std::uint32_t> version_;
  std::optional<VessaSessionMessageType> type_;
  std::optional<P> data_;

  static constexpr std::tuple fields{
      field<&Envelope::version_>(1, "version"),
      field<&Envelope::type_>(2, "type"),
      field<&Envelope::data_>(3, "data"),
  };
};

// The envelope's own field table is what counts.
static_assert(std::ranges::equal(Envelope<Group>::_protobuf_nameMap().entries(),
                                 SessionMessage::_protobuf_nameMap().entries(),
                                 [](const NameMap::Entry& left, const NameMap::Entry& right) {
                                   return left.number == right.number && left.name == right.name;
                                 }));

// The payload in an envelope of its type. To write it at once, Envelope saves a copy.
template <Carried M>
[[nodiscard]] std::expected<SessionMessage, EncodeError> pack(const M& payload) {
  const auto bytes = payload.serialize();
  if (!bytes) return std::unexpected(bytes.error());
  SessionMessage envelope;
  envelope.setType(*typeCarrying<M>);
  envelope.setData(ByteBuffer(*bytes));
  return envelope;
}

// Why an envelope's payload could not be had.
struct Error {
  enum class Cause : std::uint8_t {
    unknownType,       // no payload is paired with the envelope's type
    noData,            // the envelope has no data; an empty one is an empty payload
    malformedPayload,  // decodeError says why
  };

  Cause cause;
  VessaSessionMessageType type;
  // For malformedPayload; its offset counts from the payload's first byte.
  std::optional<DecodeError> decodeError{};

  // What is wrong, in a line: "an envelope of the type unknown carries no payload".
  std::string message() const;

  friend std::ostream& operator<<(std::ostream& out, const Error& error) {
    return internal::print(out, error.message());
  }
};

// The payload that the envelope's type names.
[[nodiscard]] std::expected<Payload, Error> unpack(const SessionMessage& envelope);

// "joinRequest", or the number of a type that has no name.
std::string nameOf(VessaSessionMessageType type);

}  // namespace orv::envelope

template <>
class std::bad_expected_access<orv::envelope::Error> : public orv::internal::BadAccess<orv::envelope::Error> {
  using BadAccess::BadAccess;
};
