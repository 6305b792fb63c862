#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <variant>
#include <vector>

#include "bench/workloads/workloads.hpp"

// The messages as plain structs of the standard library, each with one row per field. They are what peers build
// their own messages from, and what the messages written by hand over protozero are.
namespace bench::plain {

struct Text : std::string {};
struct Bytes : std::string {};

// Unknown fields as they stood in the input, one after the other.
struct Unknown {
  std::string unknown;
  bool operator==(const Unknown&) const = default;
};

// A field: its number and where it is kept. A member of a oneof also names its case.
template <auto member, class Case = void>
struct Field {
  std::uint32_t number;
  static constexpr auto pointer = member;
  using Held = Case;
};
template <auto member, class Case = void>
constexpr Field<member, Case> field(std::uint32_t number) {
  return {number};
}

struct SessionMessage : Unknown {
  std::optional<std::uint32_t> version;
  std::optional<std::int32_t> type;
  std::optional<Bytes> data;
  bool operator==(const SessionMessage&) const = default;
  static constexpr std::tuple fields{field<&SessionMessage::version>(1), field<&SessionMessage::type>(2),
                                     field<&SessionMessage::data>(3)};
};

struct ConnectionRequest : Unknown {
  Text identifier;
  Text handle;
  std::optional<Text> displayName;
  std::optional<Bytes> userInfo;
  bool operator==(const ConnectionRequest&) const = default;
  static constexpr std::tuple fields{
      field<&ConnectionRequest::identifier>(1), field<&ConnectionRequest::handle>(2),
      field<&ConnectionRequest::displayName>(3), field<&ConnectionRequest::userInfo>(4)};
};

struct Denied : Unknown {
  bool operator==(const Denied&) const = default;
  static constexpr std::tuple<> fields{};
};

struct ConnectionApproval : Unknown {
  Bytes invitationData;
  bool operator==(const ConnectionApproval&) const = default;
  static constexpr std::tuple fields{field<&ConnectionApproval::invitationData>(1)};
};

struct ConnectionResponseContent : Unknown {
  Text identifier;
  Text handle;
  std::variant<std::monostate, Denied, ConnectionApproval> operation;
  bool operator==(const ConnectionResponseContent&) const = default;
  static constexpr std::tuple fields{field<&ConnectionResponseContent::identifier>(1),
                                     field<&ConnectionResponseContent::handle>(2),
                                     field<&ConnectionResponseContent::operation, Denied>(3),
                                     field<&ConnectionResponseContent::operation, ConnectionApproval>(4)};
};

struct JoinRequest : Unknown {
  std::optional<Bytes> publicKey;
  std::optional<Bytes> encryptedData;
  bool operator==(const JoinRequest&) const = default;
  static constexpr std::tuple fields{field<&JoinRequest::publicKey>(1),
                                     field<&JoinRequest::encryptedData>(2)};
};

struct JoinRequestContent : Unknown {
  Text identifier;
  std::optional<Text> displayName;
  std::optional<Bytes> userInfo;
  std::optional<bool> wantsTokenURI;
  bool operator==(const JoinRequestContent&) const = default;
  static constexpr std::tuple fields{
      field<&JoinRequestContent::identifier>(1), field<&JoinRequestContent::displayName>(3),
      field<&JoinRequestContent::userInfo>(4), field<&JoinRequestContent::wantsTokenURI>(5)};
};

struct JoinApproval : Unknown {
  Text sessionIdentifier;
  std::vector<Text> memberHandles;
  std::optional<Bytes> userInfo;
  bool operator==(const JoinApproval&) const = default;
  static constexpr std::tuple fields{field<&JoinApproval::sessionIdentifier>(1),
                                     field<&JoinApproval::memberHandles>(2),
                                     field<&JoinApproval::userInfo>(3)};
};

struct JoinResponseContent : Unknown {
  Text identifier;
  std::variant<std::monostate, Denied, JoinApproval> operation;
  bool operator==(const JoinResponseContent&) const = default;
  static constexpr std::tuple fields{field<&JoinResponseContent::identifier>(1),
                                     field<&JoinResponseContent::operation, Denied>(3),
                                     field<&JoinResponseContent::operation, JoinApproval>(4)};
};

struct Member : Unknown {
  Text handle;
  std::optional<Text> tokenID;
  bool operator==(const Member&) const = default;
  static constexpr std::tuple fields{field<&Member::handle>(1), field<&Member::tokenID>(2)};
};

struct Initialization : Unknown {
  Bytes groupUUID;
  std::vector<Member> members;
  bool operator==(const Initialization&) const = default;
  static constexpr std::tuple fields{field<&Initialization::groupUUID>(1),
                                     field<&Initialization::members>(2)};
};

// Added and removed look alike and differ as cases of the oneof.
template <int number>
struct MemberChange : Unknown {
  Bytes groupUUID;
  std::optional<Member> member;
  bool operator==(const MemberChange&) const = default;
  static constexpr std::tuple fields{field<&MemberChange::groupUUID>(1), field<&MemberChange::member>(2)};
};
using MemberAdded = MemberChange<2>;
using MemberRemoved = MemberChange<3>;

struct MemberLeft : Unknown {
  Bytes groupUUID;
  bool usesToken = false;
  bool operator==(const MemberLeft&) const = default;
  static constexpr std::tuple fields{field<&MemberLeft::groupUUID>(1), field<&MemberLeft::usesToken>(2)};
};

struct Group : Unknown {
  std::variant<std::monostate, Initialization, MemberAdded, MemberRemoved, MemberLeft> event;
  bool operator==(const Group&) const = default;
  static constexpr std::tuple fields{
      field<&Group::event, Initialization>(1), field<&Group::event, MemberAdded>(2),
      field<&Group::event, MemberRemoved>(3), field<&Group::event, MemberLeft>(4)};
};

template <Kind kind>
using Message = std::tuple_element_t<static_cast<std::size_t>(kind),
                                     std::tuple<SessionMessage, ConnectionRequest, ConnectionResponseContent,
                                                JoinRequest, JoinRequestContent, JoinResponseContent, Group>>;

template <class T, template <class...> class Template>
inline constexpr bool isA = false;
template <template <class...> class Template, class... Arguments>
inline constexpr bool isA<Template<Arguments...>, Template> = true;

template <class T>
inline constexpr bool isNumber = std::is_arithmetic_v<T>;
template <class T>
inline constexpr bool isNumber<std::optional<T>> = std::is_arithmetic_v<T>;

}  // namespace bench::plain

namespace bench {

// What reading a message comes to: its numbers, and the size and the last byte of each text and byte field.
inline std::size_t weigh(std::string_view content) {
  return content.size() + (content.empty() ? 0 : static_cast<unsigned char>(content.back()));
}

// As each peer weighs its own messages field by field.
template <class T>
std::size_t weighPlain(const T& value) {
  if constexpr (std::is_arithmetic_v<T>) {
    return static_cast<std::size_t>(value);
  } else if constexpr (std::is_convertible_v<const T&, std::string_view>) {
    return weigh(value);
  } else if constexpr (plain::isA<T, std::optional>) {
    return value ? weighPlain(*value) : 0;
  } else if constexpr (plain::isA<T, std::vector>) {
    std::size_t sum = 0;
    for (const auto& element : value) sum += weighPlain(element);
    return sum;
  } else {
    return std::apply(
        [&](const auto&... row) {
          [[maybe_unused]] const auto weighRow = [&]<auto pointer, class Case>(
              const plain::Field<pointer, Case>&) {
            if constexpr (std::is_void_v<Case>) {
              return weighPlain(value.*pointer);
            } else {
              const Case* const held = std::get_if<Case>(&(value.*pointer));
              return held ? weighPlain(*held) : 0;
            }
          };
          return (std::size_t{0} + ... + weighRow(row));
        },
        T::fields);
  }
}

}  // namespace bench
