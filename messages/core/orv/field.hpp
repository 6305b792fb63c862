// The rows of a message's field table.
#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>
#include <type_traits>
#include <variant>
#include <vector>

#include <orv/byte_buffer.hpp>
#include <orv/descriptor.hpp>
#include <orv/text.hpp>

namespace orv::inline v0 {

template <class M>
class Message;
template <class E>
class Enumeration;

namespace internal {

template <class T>
concept IsMessage = std::derived_from<T, Message<T>>;
template <class T>
concept IsEnumeration = std::derived_from<T, Enumeration<T>>;

template <class Pointer>
struct MemberOf;
template <class M, class Storage>
struct MemberOf<Storage M::*> {
  using Type = Storage;
};
template <auto Pointer>
using PointedTo = typename MemberOf<decltype(Pointer)>::Type;

// The kind of field that a storage keeps, and the type of its values.
template <class Storage>
struct StorageTraits {
  static constexpr FieldKind kind = FieldKind::implicitPresence;
  using Value = Storage;
  static constexpr bool isKnown =
      std::same_as<Value, Text> || std::same_as<Value, ByteBuffer> || std::same_as<Value, bool>;
};
template <class T>
struct StorageTraits<std::optional<T>> {
  static constexpr FieldKind kind = IsMessage<T> ? FieldKind::singularMessage : FieldKind::explicitPresence;
  using Value = T;
  static constexpr bool isKnown =
      StorageTraits<T>::isKnown || std::same_as<T, std::uint32_t> || IsEnumeration<T> || IsMessage<T>;
};
template <class T>
struct StorageTraits<std::vector<T>> {
  static constexpr FieldKind kind = FieldKind::repeated;
  using Value = T;
  static constexpr bool isKnown = std::same_as<T, Text> || IsMessage<T>;
};
template <class... Cases>
struct StorageTraits<std::optional<std::variant<Cases...>>> {
  static constexpr FieldKind kind = FieldKind::oneofMember;
  using Value = void;  // the row says which case
  static constexpr bool isKnown = (IsMessage<Cases> && ...);
  static constexpr std::size_t caseCount = sizeof...(Cases);
  template <class Case>
  static constexpr bool hasCase = (std::same_as<Case, Cases> || ...);
};

template <class Storage>
inline constexpr bool isOneofGroup = StorageTraits<Storage>::kind == FieldKind::oneofMember;

// Whether there are rules for a row with this storage and, of a oneof group, this case.
template <class Storage, class Case>
concept StorageOfAField = StorageTraits<Storage>::isKnown &&
    (isOneofGroup<Storage> ? !std::is_void_v<Case> : std::is_void_v<Case>)&&[] {
      if constexpr (isOneofGroup<Storage>) return StorageTraits<Storage>::template hasCase<Case>;
      return true;
    }();

template <class Value>
consteval ValueType valueTypeOf() {
  if constexpr (std::same_as<Value, Text>) return ValueType::string;
  if constexpr (std::same_as<Value, ByteBuffer>) return ValueType::bytes;
  if constexpr (std::same_as<Value, bool>) return ValueType::boolean;
  if constexpr (std::same_as<Value, std::uint32_t>) return ValueType::uint32;
  if constexpr (IsEnumeration<Value>) return ValueType::enumeration;
  return ValueType::message;
}

}  // namespace internal

// The type of its storage says how a field is kept:
//
//   Text, ByteBuffer, bool                             implicit presence
//   std::optional of these, of std::uint32_t, of an
//     enumeration, of a message                        explicit presence (a message always has it)
//   std::vector of Text or of a message                repeated
//   std::optional<std::variant<messages…>>             a oneof group, with one row for each alternative
//
// One row: where the field is stored, its number and its text name. `Case` is the payload's type when the
// storage is a oneof group.
template <auto Pointer, class Case>
struct Field {
  std::uint32_t number;
  std::string_view name;
  bool isSecret;
};

// The last word of a row whose value is to be kept out of logs: a token, a key, sealed bytes.
enum class Secrecy : bool { open, secret };
inline constexpr Secrecy secret = Secrecy::secret;

template <auto Pointer, class Case = void>
requires internal::StorageOfAField<internal::PointedTo<Pointer>, Case>
consteval Field<Pointer, Case> field(std::uint32_t number, std::string_view name,
                                     Secrecy secrecy = Secrecy::open) {
  return {number, name, secrecy == secret};
}

}  // namespace orv
