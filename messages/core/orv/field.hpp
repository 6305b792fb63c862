// The rows of a message's field table.
#pragma once

#include <cstdint>
#include <string_view>

namespace orv {

// The type of its storage says how a field is kept: T has implicit presence, std::optional<T> explicit
// presence (a message always does), std::vector<T> is repeated, and std::optional<std::variant<…>> is a oneof
// group, with one row for each alternative.
//
// One row: where the field is stored, its number and its text name. `Case` is the payload's type when the
// storage is a oneof group.
template <auto Pointer, class Case>
struct Field {
  std::uint32_t number;
  std::string_view name;
};

template <auto Pointer, class Case = void>
constexpr Field<Pointer, Case> field(std::uint32_t number, std::string_view name) {
  return {number, name};
}

}  // namespace orv
