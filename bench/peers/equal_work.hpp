#pragma once

#include <cstddef>
#include <limits>

namespace bench {

// What most peers say of themselves: they check text, keep unknown fields, use a value's memory again and hold
// lists and contents of any size. Nobody but us finds texts equal that differ in their normal form.
struct EqualWork {
  static constexpr bool checksText = true;
  static constexpr bool keepsUnknownFields = true;
  static constexpr bool reusesMemory = true;
  static constexpr bool equatesNormalForms = false;
  static constexpr std::size_t largest = std::numeric_limits<std::size_t>::max();
};

}  // namespace bench
