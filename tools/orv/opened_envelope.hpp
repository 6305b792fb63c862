// An envelope whose payload can be seen.
#pragma once

#include <algorithm>
#include <expected>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>

#include <orv/instantiate.hpp>
#include <orv/session_message.hpp>

namespace orv::tool {

// A SessionMessage with its payload as a message in place of its bytes. Both are encoded alike, so it is a
// message itself, and everything that works on messages shows, reads and compares the payload in its place.
template <class Payload>
class OpenedEnvelope final : public Message<OpenedEnvelope<Payload>> {
 public:
  static constexpr std::string_view protoMessageName = SessionMessage::protoMessageName;

  OpenedEnvelope() noexcept {}
  OpenedEnvelope(const SessionMessage& envelope, Payload payload) : data_(std::move(payload)) {
    if (envelope.hasVersion()) version_ = envelope.version();
    if (envelope.hasType()) type_ = envelope.type();
    this->setUnknownFields(envelope.unknownFields());
  }

 private:
  friend Message<OpenedEnvelope>;  // the rules read the table
  std::optional<std::uint32_t> version_;
  std::optional<VessaSessionMessageType> type_;
  std::optional<Payload> data_;

  static constexpr std::tuple fields{
      field<&OpenedEnvelope::version_>(1, "version"),
      field<&OpenedEnvelope::type_>(2, "type"),
      field<&OpenedEnvelope::data_>(3, "data"),
  };
};

// The envelope's own field table is what counts.
constexpr bool isNamedAsTheEnvelope(NameMap names) {
  return std::ranges::equal(names.entries(), SessionMessage::_protobuf_nameMap().entries(),
                            [](const NameMap::Entry& left, const NameMap::Entry& right) {
                              return left.number == right.number && left.name == right.name;
                            });
}
static_assert(isNamedAsTheEnvelope(OpenedEnvelope<SessionMessage>::_protobuf_nameMap()));

}  // namespace orv::tool
