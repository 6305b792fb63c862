// The envelope of the invitation protocol.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string_view>
#include <tuple>
#include <utility>

#include <orv/enumeration.hpp>
#include <orv/message.hpp>

namespace orv::inline v0 {

// The kind of the payload that a SessionMessage carries.
class VessaSessionMessageType final : public Enumeration<VessaSessionMessageType> {
 public:
  constexpr VessaSessionMessageType() : Enumeration(0) {}
  constexpr explicit VessaSessionMessageType(std::int64_t rawValue) : Enumeration(rawValue) {}

  static const VessaSessionMessageType unknown;
  static const VessaSessionMessageType joinRequest;
  static const VessaSessionMessageType joinResponse;
  static const VessaSessionMessageType connectionRequest;
  static const VessaSessionMessageType connectionResponse;
  static const VessaSessionMessageType groupMessage;

 private:
  friend Enumeration;  // the rules read the table
  static const std::array<NameMap::Entry, 6> cases;
};

inline constexpr VessaSessionMessageType VessaSessionMessageType::unknown{0};
inline constexpr VessaSessionMessageType VessaSessionMessageType::joinRequest{1};
inline constexpr VessaSessionMessageType VessaSessionMessageType::joinResponse{2};
inline constexpr VessaSessionMessageType VessaSessionMessageType::connectionRequest{3};
inline constexpr VessaSessionMessageType VessaSessionMessageType::connectionResponse{4};
inline constexpr VessaSessionMessageType VessaSessionMessageType::groupMessage{5};

inline constexpr std::array<NameMap::Entry, 6> VessaSessionMessageType::cases{{
    {unknown.rawValue(), "unknown"},
    {joinRequest.rawValue(), "joinRequest"},
    {joinResponse.rawValue(), "joinResponse"},
    {connectionRequest.rawValue(), "connectionRequest"},
    {connectionResponse.rawValue(), "connectionResponse"},
    {groupMessage.rawValue(), "groupMessage"},
}};

// The envelope: a protocol version, the kind of the payload, and the payload as bytes, which it does not look
// into.
class SessionMessage final : public Message<SessionMessage> {
 public:
  static constexpr std::string_view protoMessageName = "orv.SessionMessage";

  SessionMessage() noexcept {}
  SessionMessage(const SessionMessage&) = default;
  SessionMessage(SessionMessage&&) noexcept = default;
  SessionMessage& operator=(const SessionMessage& other) { return assign(other); }
  SessionMessage& operator=(SessionMessage&& other) noexcept { return assign(std::move(other)); }

  std::uint32_t version() const { return version_.value_or(0); }
  std::uint32_t& mutableVersion() { return internal::presentValue(version_); }  // present from then on
  void setVersion(std::uint32_t value) { version_ = value; }
  bool hasVersion() const { return version_.has_value(); }
  void clearVersion() { version_.reset(); }

  VessaSessionMessageType type() const { return type_.value_or(VessaSessionMessageType()); }
  VessaSessionMessageType& mutableType() { return internal::presentValue(type_); }  // present from then on
  void setType(VessaSessionMessageType value) { type_ = value; }
  bool hasType() const { return type_.has_value(); }
  void clearType() { type_.reset(); }

  // The payload's own encoding, in a form that the peers agree on.
  const ByteBuffer& data() const ORV_BOUND { return internal::valueOrDefault(data_); }
  ByteBuffer& mutableData() { return internal::presentValue(data_); }  // present from then on
  void setData(ByteBuffer value) { data_ = std::move(value); }
  bool hasData() const { return data_.has_value(); }
  void clearData() { data_.reset(); }

 private:
  friend Message;  // the rules read the table
  std::optional<std::uint32_t> version_;
  std::optional<VessaSessionMessageType> type_;
  std::optional<ByteBuffer> data_;

  static constexpr std::tuple fields{
      field<&SessionMessage::version_>(1, "version"),
      field<&SessionMessage::type_>(2, "type"),
      field<&SessionMessage::data_>(3, "data", secret),
  };
};

}  // namespace orv
