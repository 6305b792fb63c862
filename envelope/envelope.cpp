#include <orv/envelope.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<envelope::Envelope<JoinRequest>>;
template class Message<envelope::Envelope<JoinResponse>>;
template class Message<envelope::Envelope<ConnectionRequest>>;
template class Message<envelope::Envelope<ConnectionResponse::Content>>;
template class Message<envelope::Envelope<Group>>;

}  // namespace orv

namespace orv::inline v0::envelope {

namespace {

template <class M>
std::expected<Payload, Error> read(const SessionMessage& envelope) {
  auto payload = M::parse(envelope.data().bytes());
  if (!payload)
    return std::unexpected(Error{Error::Cause::malformedPayload, envelope.type(), payload.error()});
  return Payload(std::move(*payload));
}

}  // namespace

std::string nameOf(VessaSessionMessageType type) {
  const auto name = VessaSessionMessageType::_protobuf_nameMap().name(type.rawValue());
  return name ? std::string(*name) : std::to_string(type.rawValue());
}

std::string Error::message() const {
  const std::string what = "an envelope of the type " + nameOf(type);
  switch (cause) {
    case Cause::unknownType: return what + " carries no payload";
    case Cause::noData: return what + " without data";
    case Cause::malformedPayload: break;
  }
  return "malformed payload: " + decodeError->message();
}

std::expected<Payload, Error> unpack(const SessionMessage& envelope) {
  const VessaSessionMessageType type = envelope.type();
  if (payloadOf(type) == nullptr) return std::unexpected(Error{Error::Cause::unknownType, type});
  if (!envelope.hasData()) return std::unexpected(Error{Error::Cause::noData, type});
  std::expected<Payload, Error> payload;
  const auto readIf = [&]<class M>(const Pairing<M>& row) {
    if (row.type == type) payload = read<M>(envelope);
  };
  std::apply([&](const auto&... rows) { (readIf(rows), ...); }, pairings);
  return payload;
}

}  // namespace orv::envelope
