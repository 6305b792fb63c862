#include "tools/orv/payload.hpp"

#include <charconv>
#include <optional>

#include <orv/json/nearest_name.hpp>
#include <orv/wire_reader.hpp>

namespace orv::tool {

namespace {

const MessageType* usualPayload(VessaSessionMessageType type) {
  if (type == VessaSessionMessageType::joinRequest) return &typeOf<JoinRequest>();
  if (type == VessaSessionMessageType::joinResponse) return &typeOf<JoinResponse>();
  if (type == VessaSessionMessageType::connectionRequest) return &typeOf<ConnectionRequest>();
  if (type == VessaSessionMessageType::connectionResponse) return &typeOf<ConnectionResponse::Content>();
  if (type == VessaSessionMessageType::groupMessage) return &typeOf<Group>();
  return nullptr;
}

std::optional<std::int64_t> kindNumber(std::string_view kind) {
  if (const auto number = VessaSessionMessageType::_protobuf_nameMap().number(kind)) return number;
  std::int32_t number = 0;
  const auto [end, status] = std::from_chars(kind.data(), kind.data() + kind.size(), number);
  if (status != std::errc() || end != kind.data() + kind.size()) return std::nullopt;
  return number;
}

}  // namespace

const MessageType* PayloadPairing::payloadOf(VessaSessionMessageType type) const {
  if (!opens_) return nullptr;
  if (const auto found = forKind_.find(type.rawValue()); found != forKind_.end()) return found->second;
  return forAll_ != nullptr ? forAll_ : usualPayload(type);
}

std::expected<void, std::string> PayloadPairing::override(std::string_view pairing) {
  const auto equals = pairing.find('=');
  const auto payload =
      findMessageType(equals == std::string_view::npos ? pairing : pairing.substr(equals + 1));
  if (!payload) return std::unexpected(payload.error());
  if (equals == std::string_view::npos) {
    forAll_ = *payload;
    return {};
  }
  const std::string_view kind = pairing.substr(0, equals);
  const auto number = kindNumber(kind);
  if (!number) {
    return std::unexpected("unknown envelope type \"" + std::string(kind) + "\"" +
                           json::suggestion(kind, VessaSessionMessageType::_protobuf_nameMap()));
  }
  forKind_[*number] = *payload;
  return {};
}

std::span<const std::byte> payloadBytes(std::span<const std::byte> envelope) {
  auto payload = envelope.first(0);
  WireReader reader(envelope);
  while (!reader.isAtEnd()) {
    const std::byte* const tagStart = reader.position();
    const auto tag = reader.readTag();
    if (!tag) break;
    if (tag->fieldNumber() == dataNumber && tag->wireType() == WireType::lengthDelimited) {
      const auto body = reader.readLengthDelimited();
      if (!body) break;
      payload = *body;
    } else if (!reader.skipValue(*tag, tagStart, 0)) {
      break;
    }
  }
  return payload;
}

std::string_view kindCarrying(const MessageType& payload) {
  for (const NameMap::Entry& entry : VessaSessionMessageType::_protobuf_nameMap().entries()) {
    if (usualPayload(VessaSessionMessageType(entry.number)) == &payload) return entry.name;
  }
  return {};
}

}  // namespace orv::tool
