// The rules of all messages, over a message's field table: names, decode loop, encode walk, equality.
// Included by message.hpp; the rules for the built-in decoders and visitors are compiled in the library
// (built_in.hpp).
#pragma once

#include <array>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <tuple>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include <orv/enumeration.hpp>
#include <orv/message.hpp>

namespace orv::rules {

// What a field's storage holds, and in which form.
template <class Storage>
struct StorageTraits {
  using Value = Storage;
  static constexpr bool isRepeated = false;
};
template <class T>
struct StorageTraits<std::optional<T>> {
  using Value = T;
  static constexpr bool isRepeated = false;
};
template <class T>
struct StorageTraits<std::vector<T>> {
  using Value = T;
  static constexpr bool isRepeated = true;
};

template <class Pointer>
struct PointedTo;
template <class M, class Storage>
struct PointedTo<Storage M::*> {
  using Type = Storage;
};

template <class T>
concept AnyMessage = std::derived_from<T, Message<T>>;
template <class T>
concept AnyEnumeration = std::derived_from<T, Enumeration<T>>;

// The decode action for one occurrence of a field that is no oneof member: the operation for the type of its
// storage.
template <class D, class Storage>
DecodeResult<D> decodeInto(D& decoder, Storage& storage) {
  using Value = typename StorageTraits<Storage>::Value;
  constexpr bool isRepeated = StorageTraits<Storage>::isRepeated;
  if constexpr (std::same_as<Value, Text> && isRepeated) {
    return decoder.decodeRepeatedStringField(storage);
  } else if constexpr (std::same_as<Value, Text>) {
    return decoder.decodeSingularStringField(storage);
  } else if constexpr (std::same_as<Value, ByteBuffer>) {
    return decoder.decodeSingularBytesField(storage);
  } else if constexpr (std::same_as<Value, bool>) {
    return decoder.decodeSingularBoolField(storage);
  } else if constexpr (std::same_as<Value, std::uint32_t>) {
    return decoder.decodeSingularUInt32Field(storage);
  } else if constexpr (AnyEnumeration<Value>) {
    return decoder.decodeSingularEnumField(storage);
  } else if constexpr (isRepeated) {
    return decoder.decodeRepeatedMessageField(storage);
  } else {
    return decoder.decodeSingularMessageField(storage);
  }
}

// One occurrence of a oneof member. It is merged into the payload if the group holds this member, and
// replaces any other. Unless it is read whole, and the decoder accepts it where the group held a case, the
// group stays as it was.
template <class Case, class D, class... Cases>
DecodeResult<D> decodeOneofMember(D& decoder, std::optional<std::variant<Cases...>>& group) {
  const bool heldACase = group.has_value();
  Case* const held = heldACase ? std::get_if<Case>(&*group) : nullptr;
  if constexpr (RereadingDecoder<D>) {
    if (!heldACase) {
      if (!decoder.isAtLengthDelimitedField()) return {};
      if (auto read = decoder.readNewMessage(presentCase<Case>(group)); !read) {
        group.reset();
        return read;
      }
      return {};
    }
    if (held != nullptr) {
      if (auto checked = decoder.checkMessageField(*held); !checked) return checked;
      if (auto accepted = decoder.handleConflictingOneOf(); !accepted) return accepted;
      return decoder.mergeMessageField(*held);
    }
  }
  std::optional<Case> working;
  if (held != nullptr) working = *held;
  if (auto result = decoder.decodeSingularMessageField(working); !result) return result;
  if (!working.has_value()) return {};
  if (heldACase) {
    if (auto accepted = decoder.handleConflictingOneOf(); !accepted) return accepted;
  }
  group.emplace(std::move(*working));
  return {};
}

// The visitor operation for the type of a field's value.
template <class V, class Value>
VisitResult<V> visitValue(V& visitor, const Value& value, std::uint32_t number) {
  if constexpr (std::same_as<Value, Text>) {
    return visitor.visitSingularStringField(value, number);
  } else if constexpr (std::same_as<Value, ByteBuffer>) {
    return visitor.visitSingularBytesField(value, number);
  } else if constexpr (std::same_as<Value, bool>) {
    return visitor.visitSingularBoolField(value, number);
  } else if constexpr (std::same_as<Value, std::uint32_t>) {
    return visitor.visitSingularUInt32Field(value, number);
  } else if constexpr (AnyEnumeration<Value>) {
    return visitor.visitSingularEnumField(value, number);
  } else {
    return visitor.visitSingularMessageField(value, number);
  }
}

// A field with implicit presence is left out when it holds its default.
template <class V, class Value>
VisitResult<V> visitStorage(V& visitor, const Value& value, std::uint32_t number) {
  bool isDefault;
  if constexpr (std::same_as<Value, bool>) {
    isDefault = !value;
  } else {
    isDefault = value.isEmpty();
  }
  if (isDefault) return {};
  return visitValue(visitor, value, number);
}

// A field with explicit presence is emitted when present, whatever its value.
template <class V, class Value>
VisitResult<V> visitStorage(V& visitor, const std::optional<Value>& value, std::uint32_t number) {
  if (!value.has_value()) return {};
  return visitValue(visitor, *value, number);
}

// A list that is not empty is handed over in one call.
template <class V, class Element>
VisitResult<V> visitStorage(V& visitor, const std::vector<Element>& list, std::uint32_t number) {
  if (list.empty()) return {};
  if constexpr (std::same_as<Element, Text>) {
    return visitor.visitRepeatedStringField(list, number);
  } else {
    return visitor.visitRepeatedMessageField(list, number);
  }
}

// About how many bytes a field takes in the encoding, tag and length included.
template <class Storage>
std::size_t likelySize(const Storage& storage) {
  constexpr std::size_t headSize = 2;
  if constexpr (requires { storage.sizeInBytes(); }) {
    return headSize + storage.sizeInBytes();
  } else if constexpr (requires { storage.has_value(); }) {
    return storage.has_value() ? likelySize(*storage) : 0;
  } else if constexpr (StorageTraits<Storage>::isRepeated) {
    // A member with a typical handle and token takes two thirds of its size in memory, a typical handle as
    // well.
    constexpr std::size_t elementSize = sizeof(typename Storage::value_type) * 2 / 3;
    return storage.size() * elementSize;
  } else {
    return headSize;
  }
}

// Whether Case is the first alternative of the group that is kept in this storage.
template <class Case, class Storage>
inline constexpr bool isFirstCase = false;
template <class Case, class... Others>
inline constexpr bool isFirstCase<Case, std::optional<std::variant<Case, Others...>>> = true;

template <class Value>
constexpr ValueType valueTypeOf() {
  if constexpr (std::same_as<Value, Text>) return ValueType::string;
  if constexpr (std::same_as<Value, ByteBuffer>) return ValueType::bytes;
  if constexpr (std::same_as<Value, bool>) return ValueType::boolean;
  if constexpr (std::same_as<Value, std::uint32_t>) return ValueType::uint32;
  if constexpr (AnyEnumeration<Value>) return ValueType::enumeration;
  return ValueType::message;
}

template <class Storage, class Case>
constexpr FieldKind kindOf() {
  if constexpr (!std::is_void_v<Case>) return FieldKind::oneofMember;
  if constexpr (StorageTraits<Storage>::isRepeated) return FieldKind::repeated;
  if constexpr (AnyMessage<typename StorageTraits<Storage>::Value>) return FieldKind::singularMessage;
  if constexpr (std::same_as<typename StorageTraits<Storage>::Value, Storage>)
    return FieldKind::implicitPresence;
  return FieldKind::explicitPresence;
}

template <auto pointer, class Case>
constexpr FieldDescriptor descriptorOfRow(const Field<pointer, Case>& row, std::uint8_t oneof) {
  using Storage = typename PointedTo<decltype(pointer)>::Type;
  using Value = std::conditional_t<std::is_void_v<Case>, typename StorageTraits<Storage>::Value, Case>;
  FieldDescriptor field{row.number, row.name, kindOf<Storage, Case>(), valueTypeOf<Value>(), oneof,
                        nullptr,    {}};
  if constexpr (AnyMessage<Value>) field.message = &Value::descriptor();
  if constexpr (AnyEnumeration<Value>) field.cases = Value::_protobuf_nameMap();
  return field;
}

}  // namespace orv::rules

namespace orv {

template <class M>
constexpr NameMap Message<M>::_protobuf_nameMap() {
  return NameMap(Constants<M>::names);
}

template <class M>
constexpr const MessageDescriptor& Message<M>::descriptor() {
  return Constants<M>::descriptor;
}

template <class M>
template <class Complete>
struct Message<M>::Constants {
  // How many oneofs begin before the one that the row belongs to: each begins with its first case.
  template <class C, auto pointer, class Case>
  static constexpr std::uint8_t oneofIndex(const Field<pointer, Case>&) {
    std::uint8_t begun = 0;
    std::uint8_t index = 0;
    const auto look = [&]<auto other, class OtherCase>(const Field<other, OtherCase>&) {
      if constexpr (!std::is_void_v<OtherCase>) {
        if (rules::isFirstCase<OtherCase, typename rules::PointedTo<decltype(other)>::Type>) ++begun;
        if constexpr (std::is_same_v<std::integral_constant<decltype(pointer), pointer>,
                                     std::integral_constant<decltype(other), other>>)
          index = static_cast<std::uint8_t>(begun - 1);
      }
    };
    std::apply([&](const auto&... rows) { (look(rows), ...); }, C::fields);
    return index;
  }

  static constexpr auto names = std::apply(
      [](const auto&... rows) {
        return std::array<NameMap::Entry, sizeof...(rows)>{NameMap::Entry{rows.number, rows.name}...};
      },
      Complete::fields);
  static constexpr auto fields = std::apply(
      [](const auto&... rows) {
        return std::array<FieldDescriptor, sizeof...(rows)>{
            rules::descriptorOfRow(rows, oneofIndex<Complete>(rows))...};
      },
      Complete::fields);
  static constexpr MessageDescriptor descriptor{Complete::protoMessageName, fields};
};

template <class M>
template <class D>
DecodeResult<D> Message<M>::decodeFields(D& decoder) {
  for (;;) {
    const auto number = decoder.nextFieldNumber(self());
    if (!number) [[unlikely]]
      return std::unexpected(number.error());
    if (!number->has_value()) return {};
    auto result = decodeRow<0>(decoder, **number);
    if (!result) [[unlikely]]
      return result;
  }
}

// Finds the row of the number. A number without a row is left to the decoder, which keeps it as unknown.
template <class M>
template <std::size_t index, class D>
DecodeResult<D> Message<M>::decodeRow(D& decoder, std::uint32_t number) {
  if constexpr (index == std::tuple_size_v<decltype(M::fields)>) {
    return {};
  } else {
    constexpr auto row = std::get<index>(M::fields);
    if (number == row.number) return decodeField(decoder, row);
    return decodeRow<index + 1>(decoder, number);
  }
}

template <class M>
template <class D, auto pointer, class Case>
DecodeResult<D> Message<M>::decodeField(D& decoder, const Field<pointer, Case>&) {
  if constexpr (std::is_void_v<Case>) {
    return rules::decodeInto(decoder, self().*pointer);
  } else {
    return rules::decodeOneofMember<Case>(decoder, self().*pointer);
  }
}

template <class M>
template <class V>
VisitResult<V> Message<M>::visitFields(V& visitor) const {
  return visitRowsFrom<0>(visitor);
}

template <class M>
template <std::size_t index, class V>
VisitResult<V> Message<M>::visitRowsFrom(V& visitor) const {
  if constexpr (index == std::tuple_size_v<decltype(M::fields)>) {
    return unknownFields_.traverse(visitor);
  } else {
    constexpr auto row = std::get<index>(M::fields);
    if (auto result = visitField(visitor, row); !result) [[unlikely]]
      return result;
    return visitRowsFrom<index + 1>(visitor);
  }
}

template <class M>
template <class V, auto pointer, class Case>
VisitResult<V> Message<M>::visitField(V& visitor, const Field<pointer, Case>& row) const {
  const auto& storage = self().*pointer;
  if constexpr (std::is_void_v<Case>) {
    return rules::visitStorage(visitor, storage, row.number);
  } else {
    const Case* const held = storage.has_value() ? std::get_if<Case>(&*storage) : nullptr;
    if (held == nullptr) return {};
    return visitor.visitSingularMessageField(*held, row.number);
  }
}

template <class M>
std::size_t Message<M>::likelyEncodedSize() const {
  const auto sizeOfRow = [&]<auto pointer, class Case>(const Field<pointer, Case>&)->std::size_t {
    return rules::likelySize(self().*pointer);
  };
  const auto sizeOfRows = [&](const auto&... rows) { return (std::size_t{0} + ... + sizeOfRow(rows)); };
  return std::apply(sizeOfRows, M::fields);
}

template <class M>
bool Message<M>::hasEqualFields(const M& other) const {
  const auto areEqual = [&](const auto&... rows) { return (hasEqualField(other, rows) && ...); };
  return std::apply(areEqual, M::fields) && unknownFields_ == other.unknownFields_;
}

template <class M>
template <auto pointer, class Case>
bool Message<M>::hasEqualField(const M& other, const Field<pointer, Case>&) const {
  const auto& storage = self().*pointer;
  // A oneof group is compared as a whole, once: with its first case.
  if constexpr (!std::is_void_v<Case> && !rules::isFirstCase<Case, std::remove_cvref_t<decltype(storage)>>)
    return true;
  return storage == other.*pointer;
}

}  // namespace orv
