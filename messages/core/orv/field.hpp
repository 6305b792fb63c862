// The rows of a message's field table.
#pragma once

#include <cstdint>
#include <string_view>

#include <orv/internal/field_traits.hpp>

namespace orv::inline v0 {

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
};

template <auto Pointer, class Case = void>
requires internal::StorageOfAField<internal::PointedTo<Pointer>, Case>
constexpr Field<Pointer, Case> field(std::uint32_t number, std::string_view name) { return {number, name}; }

}  // namespace orv
