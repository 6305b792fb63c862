// The rows of a message's field table.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <type_traits>
#include <variant>
#include <vector>

namespace orv {

// How a field is kept. The type of its storage says which of these it is.
enum class FieldKind : std::uint8_t {
  implicitPresence,  // T
  explicitPresence,  // std::optional<T>
  singularMessage,   // std::optional<a message>
  repeated,          // std::vector<T>
  oneofMember,       // std::optional<std::variant<…>>, one row for each alternative
};

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
