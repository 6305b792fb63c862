#include "tools/orv/messages/message_type.hpp"

#include <algorithm>
#include <array>
#include <charconv>
#include <vector>

#include <orv/envelope.hpp>
#include <orv/spelling/nearest_name.hpp>
#include <orv/spelling/value_text.hpp>
#include <orv/wire_reader.hpp>

namespace orv::tool {

namespace {

constexpr auto types = [] {
  std::array<MessageType, AllMessages::size> list{};
  std::size_t index = 0;
  AllMessages::forEach([&]<class M>() {
    list[index] = {index, &M::descriptor()};
    ++index;
  });
  return list;
}();

// In the order of ValueType.
constexpr std::array<std::string_view, 6> valueTypeNames{"string", "bytes", "bool",
                                                         "uint32", "enum",  "message"};

constexpr NameMap kindNames = VessaSessionMessageType::_protobuf_nameMap();
constexpr auto typeNumber = SessionMessage::_protobuf_nameMap().number("type");
constexpr auto dataNumber = SessionMessage::_protobuf_nameMap().number("data");

std::string_view lastWord(std::string_view name) { return name.substr(name.rfind('.') + 1); }

}  // namespace

std::span<const MessageType> allMessageTypes() { return types; }

std::string_view nameOf(ValueType type) { return valueTypeNames[static_cast<std::size_t>(type)]; }

const MessageType& typeOf(const MessageDescriptor& descriptor) {
  return *std::ranges::find(types, &descriptor, &MessageType::descriptor);
}

std::expected<const MessageType*, std::string> findMessageType(std::string_view name) {
  std::vector<const MessageType*> sameLastWord;
  for (const MessageType& type : types) {
    if (name == type.fullName() || name == type.shortName()) return &type;
    if (name == lastWord(type.fullName())) sameLastWord.push_back(&type);
  }
  if (sameLastWord.size() == 1) return sameLastWord.front();
  const std::string quoted = spelling::quotedText(name);
  if (sameLastWord.empty()) {
    return std::unexpected("unknown message type " + quoted +
                           spelling::suggestion(name, types, &MessageType::shortName));
  }
  std::string error = quoted + " could be ";
  for (const MessageType* type : sameLastWord) {
    if (type != sameLastWord.front()) error += type == sameLastWord.back() ? " or " : ", ";
    error += type->shortName();
  }
  return std::unexpected(error);
}

std::optional<std::int64_t> kindNumber(std::string_view kind) {
  if (const auto number = kindNames.number(kind)) return number;
  std::int32_t number = 0;
  const auto [end, status] = std::from_chars(kind.data(), kind.data() + kind.size(), number);
  if (status != std::errc() || end != kind.data() + kind.size()) return std::nullopt;
  return number;
}

const MessageType* PayloadPairing::payloadOf(VessaSessionMessageType type) const {
  if (!opens_) return nullptr;
  if (const auto found = forKind_.find(type.rawValue()); found != forKind_.end()) return found->second;
  const MessageDescriptor* const usual = envelope::payloadOf(type);
  return usual != nullptr ? &typeOf(*usual) : forOthers_;
}

std::expected<void, std::string> PayloadPairing::override(std::string_view pairing) {
  const auto equals = pairing.find('=');
  const auto payload =
      findMessageType(equals == std::string_view::npos ? pairing : pairing.substr(equals + 1));
  if (!payload) return std::unexpected(payload.error());
  if (equals == std::string_view::npos) {
    forOthers_ = *payload;
    return {};
  }
  const std::string_view kind = pairing.substr(0, equals);
  const auto number = kindNumber(kind);
  if (!number) {
    return std::unexpected("unknown envelope type " + spelling::quotedText(kind) +
                           spelling::suggestion(kind, kindNames.entries(), &NameMap::Entry::name));
  }
  forKind_[*number] = *payload;
  return {};
}

EnvelopeOutline outlineOf(std::span<const std::byte> envelope) {
  EnvelopeOutline outline;
  WireReader reader(envelope);
  while (!reader.isAtEnd()) {
    const std::byte* const start = reader.position();
    const auto tag = reader.readTag();
    WireReader value = reader;
    if (!tag || !reader.skipValue(*tag, start, 0)) break;
    if (tag->fieldNumber() == typeNumber && tag->wireType() == WireType::varint)
      outline.type = VessaSessionMessageType(static_cast<std::int32_t>(*value.readVarint()));
    if (tag->fieldNumber() == dataNumber && tag->wireType() == WireType::lengthDelimited)
      outline.data = *value.readLengthDelimited();
  }
  return outline;
}

}  // namespace orv::tool
