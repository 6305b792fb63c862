// Values that may be absent.
#pragma once

#include <optional>

namespace orv::internal {

// The value for change in place; an absent one becomes present with its default.
template <class T>
T& presentValue(T& value) {
  return value;
}
template <class T>
T& presentValue(std::optional<T>& value) {
  return value.has_value() ? *value : value.emplace();
}

}  // namespace orv::internal
