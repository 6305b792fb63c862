// The rule by which a message is replaced by one that is read, in the memory of what it holds: what reparse
// does.
#pragma once

#include <cstddef>
#include <cstdint>
#include <expected>
#include <optional>
#include <tuple>
#include <type_traits>
#include <utility>
#include <variant>

#include <orv/message.hpp>

namespace orv::rules {

// The first occurrence of a field in a message that is being replaced: its old value goes, and its memory is
// used again. A field that is not taken keeps its old value for now.
template <class D, class Storage>
DecodeResult<D> replaceStored(D& decoder, Storage& storage) {
  if constexpr (StorageTraits<Storage>::isRepeated) {
    if (decoder.isAtLengthDelimitedField()) storage.clear();
  } else if constexpr (AnyMessage<typename StorageTraits<Storage>::Value>) {
    if (storage.has_value()) return decoder.replaceMessageField(*storage);
  }
  return decodeInto(decoder, storage);
}

template <class Case, class D, class... Cases>
DecodeResult<D> replaceOneofMember(D& decoder, std::optional<std::variant<Cases...>>& group) {
  if (!decoder.isAtLengthDelimitedField()) return {};
  if (group.has_value()) {
    if (Case* const held = std::get_if<Case>(&*group)) return decoder.replaceMessageField(*held);
    group.reset();
  }
  return decodeOneofMember<Case>(decoder, group);
}

template <auto left, auto right>
inline constexpr bool isSameStorage = std::is_same_v<std::integral_constant<decltype(left), left>,
                                                     std::integral_constant<decltype(right), right>>;

}  // namespace orv::rules

namespace orv {

// What decodeFields does to a default message, in the memory of what this one holds. A field's old value goes
// when the first occurrence of the field is read, or in the end.
template <class M>
template <class D>
DecodeResult<D> Message<M>::replaceFields(D& decoder) {
  unknownFields_ = {};
  std::uint64_t rowsRead = 0;
  DecodeResult<D> result;
  for (;;) {
    const auto number = decoder.nextFieldNumber(self());
    if (!number) [[unlikely]] {
      result = std::unexpected(number.error());
      break;
    }
    if (!number->has_value()) break;
    result = replaceRow<0>(decoder, **number, rowsRead);
    if (!result) [[unlikely]]
      break;
  }
  [&]<std::size_t... indices>(std::index_sequence<indices...>) { (resetRow<indices>(rowsRead), ...); }
  (std::make_index_sequence<std::tuple_size_v<decltype(M::fields)>>());
  return result;
}

template <class M>
template <std::size_t index, class D>
DecodeResult<D> Message<M>::replaceRow(D& decoder, std::uint32_t number, std::uint64_t& rowsRead) {
  if constexpr (index == std::tuple_size_v<decltype(M::fields)>) {
    return {};
  } else {
    constexpr auto row = std::get<index>(M::fields);
    if (number != row.number) return replaceRow<index + 1>(decoder, number, rowsRead);
    if ((rowsRead & rowBits<index>()) != 0) return decodeField(decoder, row);
    const auto replace = [&]<auto pointer, class Case>(const Field<pointer, Case>&)->DecodeResult<D> {
      if constexpr (std::is_void_v<Case>) {
        return rules::replaceStored(decoder, self().*pointer);
      } else {
        return rules::replaceOneofMember<Case>(decoder, self().*pointer);
      }
    };
    auto result = replace(row);
    if (result && decoder.hasTakenField()) rowsRead |= std::uint64_t{1} << index;
    return result;
  }
}

template <class M>
template <std::size_t index>
void Message<M>::resetRow(std::uint64_t rowsRead) {
  if ((rowsRead & rowBits<index>()) != 0) return;
  const auto reset = [&]<auto pointer, class Case>(const Field<pointer, Case>&) {
    auto& storage = self().*pointer;
    storage = std::remove_cvref_t<decltype(storage)>();
  };
  reset(std::get<index>(M::fields));
}

// The rows of the same storage: those of a oneof group, and otherwise the row alone.
template <class M>
template <std::size_t index>
constexpr std::uint64_t Message<M>::rowBits() {
  static_assert(std::tuple_size_v<decltype(M::fields)> <= 64);
  std::uint64_t bits = 0;
  std::uint64_t bit = 1;
  const auto addRow = [&]<auto other, class OtherCase>(const Field<other, OtherCase>&) {
    const auto isSame = []<auto pointer, class Case>(const Field<pointer, Case>&) {
      return rules::isSameStorage<pointer, other>;
    };
    if (isSame(std::get<index>(M::fields))) bits |= bit;
    bit <<= 1;
  };
  std::apply([&](const auto&... rows) { (addRow(rows), ...); }, M::fields);
  return bits;
}

}  // namespace orv
