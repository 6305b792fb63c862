// The rules of all messages, over a message's field table: decode loop, encode walk, equality. Rules
// that stand in the loops of decoding and encoding are inlined: docs/decisions/position-in-registers.md.
#pragma once

#include <compare>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <utility>
#include <variant>
#include <vector>

#include <orv/decoder.hpp>
#include <orv/field.hpp>
#include <orv/internal/table.hpp>
#include <orv/visitor.hpp>

namespace orv::inline v0::internal {

template <class Next>
[[gnu::always_inline]] inline bool isAtField(const Next& next) {
  return next && (*next).has_value();
}

// Takes fields that belong to the row at `index`, then to those behind it, while there are any.
template <class Table, std::size_t index, class M, class D, class Next, class Take>
[[gnu::always_inline]] inline DecodeResult<D> takeFieldsFrom(M& message, D& decoder, Next& next,
                                                             bool& isKnown, Take& take) {
  if constexpr (index < Table::size) {
    while (**next == Table::template number<index>) {
      isKnown = true;
      if (auto result = take.template operator()<index>(decoder); !result) [[unlikely]]
        return result;
      next = decoder.nextFieldNumber(message);
      if (!isAtField(next)) return {};
    }
    return takeFieldsFrom<Table, index + 1>(message, decoder, next, isKnown, take);
  } else {
    return {};
  }
}

// The decode loop: `take` is called with the index of each field's row and the decoder that stands at it. A
// number without a row is left to the decoder, which keeps the field as unknown. Most encoders write fields
// in ascending order, so the row of a field is looked for from the row of the one before it on.
template <class Table, class M, class D, class Take>
[[gnu::always_inline]] inline DecodeResult<D> readFields(M& message, D& decoder, Take take) {
  auto next = decoder.nextFieldNumber(message);
  while (isAtField(next)) {
    bool isKnown = false;
    if (auto result = takeFieldsFrom<Table, 0>(message, decoder, next, isKnown, take); !result) [[unlikely]]
      return result;
    if (!isKnown) next = decoder.nextFieldNumber(message);
  }
  if (!next) [[unlikely]]
    return std::unexpected(next.error());
  return {};
}

// The decode action for one occurrence of a field that is no oneof member: the operation for the type of its
// storage.
template <class D, class Storage>
[[gnu::always_inline]] inline DecodeResult<D> decodeField(D& decoder, Storage& storage) {
  constexpr ValueType type = valueTypeOf<typename StorageTraits<Storage>::Value>();
  constexpr bool isRepeated = StorageTraits<Storage>::kind == FieldKind::repeated;
  if constexpr (type == ValueType::string && isRepeated) {
    return decoder.decodeRepeatedStringField(storage);
  } else if constexpr (type == ValueType::string) {
    return decoder.decodeSingularStringField(storage);
  } else if constexpr (type == ValueType::bytes) {
    return decoder.decodeSingularBytesField(storage);
  } else if constexpr (type == ValueType::boolean) {
    return decoder.decodeSingularBoolField(storage);
  } else if constexpr (type == ValueType::uint32) {
    return decoder.decodeSingularUInt32Field(storage);
  } else if constexpr (type == ValueType::enumeration) {
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
[[gnu::always_inline]] inline DecodeResult<D> decodeCase(D& decoder,
                                                         std::optional<std::variant<Cases...>>& group) {
  if constexpr (requires { decoder.template decodeCase<Case>(group); }) {
    return decoder.template decodeCase<Case>(group);
  } else {
    const bool heldACase = group.has_value();
    std::optional<Case> working;
    if (heldACase) {
      if (const Case* const held = std::get_if<Case>(&*group)) working = *held;
    }
    if (auto result = decoder.decodeSingularMessageField(working); !result) return result;
    if (!working.has_value()) return {};
    if (heldACase) {
      if (auto accepted = decoder.handleConflictingOneOf(); !accepted) return accepted;
    }
    group.emplace(std::move(*working));
    return {};
  }
}

// One occurrence of the field in the row at `index`.
template <class Table, std::size_t index, class M, class D>
[[gnu::always_inline]] inline DecodeResult<D> decodeRow(M& message, D& decoder) {
  auto& storage = Table::template storage<index>(message);
  if constexpr (Table::template isCase<index>) {
    return decodeCase<typename Table::template Case<index>>(decoder, storage);
  } else {
    return decodeField(decoder, storage);
  }
}

// The visitor operation for the type of a field's value.
template <class V, class Value>
[[gnu::always_inline]] inline VisitResult<V> visitValue(V& visitor, const Value& value,
                                                        std::uint32_t number) {
  constexpr ValueType type = valueTypeOf<Value>();
  if constexpr (type == ValueType::string) {
    return visitor.visitSingularStringField(value, number);
  } else if constexpr (type == ValueType::bytes) {
    return visitor.visitSingularBytesField(value, number);
  } else if constexpr (type == ValueType::boolean) {
    return visitor.visitSingularBoolField(value, number);
  } else if constexpr (type == ValueType::uint32) {
    return visitor.visitSingularUInt32Field(value, number);
  } else if constexpr (type == ValueType::enumeration) {
    return visitor.visitSingularEnumField(value, number);
  } else {
    return visitor.visitSingularMessageField(value, number);
  }
}

// Whether a field is to be emitted; of a oneof, whether any of its members is. One with implicit presence is
// left out when it holds its default, one with explicit presence when absent, a list when empty.
template <class Storage>
[[gnu::always_inline]] inline bool isEmitted(const Storage& storage) {
  constexpr FieldKind kind = StorageTraits<Storage>::kind;
  if constexpr (kind == FieldKind::repeated) {
    return !storage.empty();
  } else if constexpr (kind != FieldKind::implicitPresence) {
    return storage.has_value();
  } else if constexpr (std::same_as<Storage, bool>) {
    return storage;
  } else {
    return !storage.isEmpty();
  }
}

template <class Table, std::size_t index, class M, class V>
[[gnu::always_inline]] inline VisitResult<V> visitRow(const M& message, V& visitor) {
  const auto& storage = Table::template storage<index>(message);
  using Storage = typename Table::template Storage<index>;
  constexpr std::uint32_t number = Table::template number<index>;
  if (!isEmitted(storage)) return {};
  if constexpr (Table::template isCase<index>) {
    const auto* const held = std::get_if<typename Table::template Case<index>>(&*storage);
    if (held == nullptr) return {};
    return visitor.visitSingularMessageField(*held, number);
  } else if constexpr (StorageTraits<Storage>::kind == FieldKind::implicitPresence) {
    return visitValue(visitor, storage, number);
  } else if constexpr (StorageTraits<Storage>::kind != FieldKind::repeated) {
    return visitValue(visitor, *storage, number);
  } else if constexpr (std::same_as<typename StorageTraits<Storage>::Value, Text>) {
    return visitor.visitRepeatedStringField(storage, number);
  } else {
    return visitor.visitRepeatedMessageField(storage, number);
  }
}

template <class Table, std::size_t index, class M, class V>
[[gnu::always_inline]] inline VisitResult<V> visitRowsFrom(const M& message, V& visitor) {
  if constexpr (index == Table::size) {
    return message.unknownFields().traverse(visitor);
  } else {
    if (auto result = visitRow<Table, index>(message, visitor); !result) [[unlikely]]
      return result;
    return visitRowsFrom<Table, index + 1>(message, visitor);
  }
}

// How many fields are emitted, the unknown ones not counted.
template <class Table, class M>
std::size_t countEmitted(const M& message) {
  std::size_t count = 0;
  Table::forEachIndex([&]<std::size_t index>() {
    if constexpr (Table::template isFirstRow<index>)
      count += isEmitted(Table::template storage<index>(message)) ? 1 : 0;
  });
  return count;
}

// The encode walk, between the visitor's beginMessage and endMessage where it has them.
template <class Table, class M, class V>
[[gnu::always_inline]] inline VisitResult<V> visitFields(const M& message, V& visitor) {
  if constexpr (requires { visitor.beginMessage(message, std::size_t{0}); }) {
    if (auto begun = visitor.beginMessage(message, countEmitted<Table>(message)); !begun) return begun;
  }
  if constexpr (requires { visitor.endMessage(message); }) {
    if (auto walked = visitRowsFrom<Table, 0>(message, visitor); !walked) return walked;
    return visitor.endMessage(message);
  } else {
    return visitRowsFrom<Table, 0>(message, visitor);
  }
}

// Each storage is compared once: a oneof group as a whole, at its first row.
template <class Table, class M>
[[gnu::always_inline]] inline bool haveEqualFields(const M& left, const M& right) {
  const auto areEqual = [&]<std::size_t index>() {
    if constexpr (Table::template isFirstRow<index>)
      return Table::template storage<index>(left) == Table::template storage<index>(right);
    else
      return true;
  };
  return [&]<std::size_t... indices>(std::index_sequence<indices...>) {
    return (areEqual.template operator()<indices>() && ...);
  }
  (std::make_index_sequence<Table::size>());
}

// The order of the first field that differs, each storage looked at once as in haveEqualFields.
template <class Table, class M>
std::weak_ordering orderOfFields(const M& left, const M& right) {
  std::weak_ordering order = std::weak_ordering::equivalent;
  const auto isDecided = [&]<std::size_t index>() {
    if constexpr (Table::template isFirstRow<index>)
      order = Table::template storage<index>(left) <=> Table::template storage<index>(right);
    return order != 0;
  };
  [&]<std::size_t... indices>(std::index_sequence<indices...>) {
    (void)(isDecided.template operator()<indices>() || ...);
  }
  (std::make_index_sequence<Table::size>());
  return order;
}

// About how many bytes a field takes in the encoding, tag and length included. Lists are judged by the size
// of their elements in memory: a member with a typical handle and token takes two thirds of it, a typical
// handle as well.
template <class Storage>
std::size_t likelySize(const Storage& storage) {
  constexpr std::size_t headSize = 2;
  if constexpr (StorageTraits<Storage>::kind == FieldKind::repeated) {
    return storage.size() * (sizeof(typename Storage::value_type) * 2 / 3);
  } else if constexpr (requires { storage.sizeInBytes(); }) {
    return headSize + storage.sizeInBytes();
  } else if constexpr (requires { storage.size(); }) {
    return headSize + storage.size();
  } else if constexpr (requires { storage.has_value(); }) {
    if constexpr (requires { storage->isEmpty(); })
      return storage.has_value() ? likelySize(*storage) : 0;
    else
      return headSize;
  } else {
    return headSize;
  }
}

}  // namespace orv::internal
