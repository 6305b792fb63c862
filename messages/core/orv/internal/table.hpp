// A message's field table, checked, and what derives from it alone.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <utility>

#include <orv/descriptor.hpp>
#include <orv/field.hpp>
#include <orv/name_map.hpp>

namespace orv::inline v0::internal {

// M's table as it stands. `Rows` hands it out: the table is private, and M lets its base see it.
template <class M, class Rows>
class UncheckedTable {
 public:
  static constexpr const auto& rows = Rows::template of<M>();
  static constexpr std::size_t size = std::tuple_size_v<std::remove_cvref_t<decltype(rows)>>;

 private:
  template <class Row>
  struct RowTraits;
  template <auto Pointer, class C>
  struct RowTraits<Field<Pointer, C>> {
    static constexpr auto pointer = Pointer;
    using Identity = std::integral_constant<decltype(Pointer), Pointer>;
    using Storage = PointedTo<Pointer>;
    using Case = C;
    using Value = std::conditional_t<std::is_void_v<C>, typename StorageTraits<Storage>::Value, C>;
  };
  template <std::size_t index>
  using TraitsOf = RowTraits<std::tuple_element_t<index, std::remove_cvref_t<decltype(rows)>>>;

 public:
  // Calls `visit` with each index as its template argument.
  template <class Visit>
  static constexpr void forEachIndex(Visit visit) {
    [&]<std::size_t... indices>(std::index_sequence<indices...>) {
      (visit.template operator()<indices>(), ...);
    }
    (std::make_index_sequence<size>());
  }

  // Of the row at an index.
  template <std::size_t index>
  static constexpr std::uint32_t number = std::get<index>(rows).number;
  template <std::size_t index>
  using Storage = typename TraitsOf<index>::Storage;
  template <std::size_t index>
  using Case = typename TraitsOf<index>::Case;  // void, but of a oneof member
  template <std::size_t index>
  static constexpr bool isCase = !std::is_void_v<Case<index>>;

  template <std::size_t index>
  static constexpr auto& storage(M& message) {
    return message.*TraitsOf<index>::pointer;
  }
  template <std::size_t index>
  static constexpr const auto& storage(const M& message) {
    return message.*TraitsOf<index>::pointer;
  }

  // The first row with the same storage: the row itself, or the first of its oneof group.
  template <std::size_t index>
  static constexpr std::size_t firstRow = [] {
    std::size_t first = index;
    UncheckedTable::forEachIndex([&]<std::size_t other>() {
      if (std::is_same_v<typename TraitsOf<index>::Identity, typename TraitsOf<other>::Identity> &&
          other < first)
        first = other;
    });
    return first;
  }();
  template <std::size_t index>
  static constexpr bool isFirstRow = firstRow<index> == index;

 protected:
  static constexpr std::array<std::uint32_t, size> numbers =
      std::apply([](const auto&... row) { return std::array<std::uint32_t, size>{row.number...}; }, rows);
  static constexpr std::array<std::string_view, size> names =
      std::apply([](const auto&... row) { return std::array<std::string_view, size>{row.name...}; }, rows);

  static consteval bool areNumbersAscending() {
    for (std::size_t at = 1; at < size; ++at) {
      if (numbers[at - 1] >= numbers[at]) return false;
    }
    return true;
  }
  // 19000 to 19999 are the format's own (protobuf.dev, "Assigning Field Numbers").
  static consteval bool areNumbersValid() {
    return std::ranges::all_of(numbers, [](std::uint32_t number) {
      return number >= 1 && number < 1U << 29 && (number < 19000 || number > 19999);
    });
  }
  static consteval bool areNamesDistinct() {
    for (std::size_t at = 0; at < size; ++at) {
      for (std::size_t other = 0; other < at; ++other) {
        if (names[at] == names[other]) return false;
      }
    }
    return true;
  }
  static consteval bool haveCasesOneRowEach() {
    bool all = true;
    forEachIndex([&]<std::size_t index>() {
      if constexpr (isCase<index>) {
        std::size_t rowsOfCase = 0;
        std::size_t rowsOfGroup = 0;
        forEachIndex([&]<std::size_t other>() {
          if constexpr (firstRow<other> == firstRow<index>) {
            ++rowsOfGroup;
            if constexpr (std::is_same_v<Case<index>, Case<other>>) ++rowsOfCase;
          }
        });
        all = all && rowsOfCase == 1 && rowsOfGroup == StorageTraits<Storage<index>>::caseCount;
      }
    });
    return all;
  }
  static consteval bool haveStoragesOneRowEach() {
    bool all = true;
    forEachIndex([&]<std::size_t index>() {
      if constexpr (!isCase<index>) all = all && isFirstRow<index>;
    });
    return all;
  }

  template <std::size_t index>
  using Value = typename TraitsOf<index>::Value;
};

// M's table, checked against the rules of tables, and the descriptor made of it.
template <class M, class Rows>
class Table : public UncheckedTable<M, Rows> {
  using Base = UncheckedTable<M, Rows>;
  static_assert(Base::areNumbersAscending(), "field table: the numbers ascend, each once");
  static_assert(Base::areNumbersValid(), "field table: numbers are 1 to 2^29-1 without 19000 to 19999");
  static_assert(Base::areNamesDistinct(), "field table: each name once");
  static_assert(Base::haveCasesOneRowEach(), "field table: each case of a oneof has exactly one row");
  static_assert(Base::haveStoragesOneRowEach(), "field table: each storage has its row once");

  template <std::size_t index>
  static consteval FieldDescriptor describe() {
    using Value = typename Base::template Value<index>;
    FieldDescriptor field{.number = Base::numbers[index],
                          .name = Base::names[index],
                          .kind = StorageTraits<typename Base::template Storage<index>>::kind,
                          .type = valueTypeOf<Value>(),
                          .oneof = oneofIndex<index>(),
                          .message = nullptr,
                          .cases = {},
                          .isSecret = std::get<index>(Base::rows).isSecret};
    if constexpr (IsMessage<Value>) field.message = &Value::descriptor();
    if constexpr (IsEnumeration<Value>) field.cases = Value::_protobuf_nameMap();
    return field;
  }
  template <std::size_t index>
  static consteval std::uint8_t oneofIndex() {
    std::uint8_t before = 0;
    Base::forEachIndex([&]<std::size_t other>() {
      if (Base::template isCase<other> && Base::template isFirstRow<other> &&
          other < Base::template firstRow<index>)
        ++before;
    });
    return Base::template isCase<index> ? before : std::uint8_t{0};
  }

  static constexpr auto nameEntries = [] {
    std::array<NameMap::Entry, Base::size> entries{};
    for (std::size_t at = 0; at < Base::size; ++at) entries[at] = {Base::numbers[at], Base::names[at]};
    return entries;
  }();
  static constexpr auto fields = []<std::size_t... indices>(std::index_sequence<indices...>) {
    return std::array<FieldDescriptor, Base::size>{describe<indices>()...};
  }
  (std::make_index_sequence<Base::size>());

 public:
  static constexpr NameMap nameMap() { return NameMap(nameEntries); }
  static constexpr MessageDescriptor descriptor{M::protoMessageName, fields};
};

}  // namespace orv::internal
