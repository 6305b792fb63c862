// How fields that may be absent are read and changed.
#pragma once

#include <cstddef>
#include <new>
#include <optional>
#include <variant>

namespace orv::inline v0::internal {

// The value for change in place; an absent one becomes present with its default.
template <class T>
T& presentValue(T& value) {
  return value;
}
template <class T>
T& presentValue(std::optional<T>& value) {
  return value.has_value() ? *value : value.emplace();
}

// What a getter gives for an absent field: one default value per type. In the default of every type that a field
// may have, each byte that has a meaning is 0, so that it need not be made, and nobody waits for it or fails to
// make it. The unit tests hold every message against this.
template <class T>
const T& defaultInstance() {
  alignas(T) static constexpr std::byte zeros[sizeof(T)]{};
  return *std::launder(reinterpret_cast<const T*>(zeros));
}

// Lives as long as the field is unchanged, or forever.
template <class T>
const T& valueOrDefault(const std::optional<T>& field) {
  return field.has_value() ? *field : defaultInstance<T>();
}

// The payload if the oneof group holds this case, else the default.
template <class Case, class... Cases>
const Case& caseOrDefault(const std::optional<std::variant<Cases...>>& group) {
  const Case* const held = group.has_value() ? std::get_if<Case>(&*group) : nullptr;
  return held != nullptr ? *held : defaultInstance<Case>();
}

// Which case the group holds, as an enumeration of none and of the cases in their order.
template <class Enumeration, class... Cases>
Enumeration caseHeld(const std::optional<std::variant<Cases...>>& group) {
  return static_cast<Enumeration>(group.has_value() ? group->index() + 1 : 0);
}

// The payload for change in place; a group that holds another case, or none, is switched to a default payload
// of this.
template <class Case, class... Cases>
Case& presentCase(std::optional<std::variant<Cases...>>& group) {
  if (group.has_value()) {
    if (Case* const held = std::get_if<Case>(&*group)) return *held;
  }
  return std::get<Case>(group.emplace(std::in_place_type<Case>));
}

}  // namespace orv::internal
