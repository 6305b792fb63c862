#pragma once

#include <cstddef>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <tuple>

#include "bench/workloads/workloads.hpp"

namespace bench {

// What the code that protoc generates does alike in all its variants. `Messages` lists the types of every
// Kind.
template <class... Messages>
struct OfficialCode {
  static constexpr bool checksText = true;
  static constexpr bool keepsUnknownFields = true;
  static constexpr bool reusesMemory = true;
  static constexpr bool equatesNormalForms = false;
  static constexpr std::size_t mostMembers = std::numeric_limits<std::size_t>::max();

  template <Kind kind>
  using Value = std::tuple_element_t<static_cast<std::size_t>(kind), std::tuple<Messages...>>;

  static bool decode(auto& value, std::string_view bytes) {
    return value.ParseFromArray(bytes.data(), static_cast<int>(bytes.size()));
  }
  static bool decodeAgain(auto& value, std::string_view bytes) { return decode(value, bytes); }
  static std::string encode(const auto& value) { return value.SerializeAsString(); }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    value.SerializeToArray(buffer.data(), static_cast<int>(buffer.size()));
    return static_cast<std::size_t>(value.GetCachedSize());
  }
};

}  // namespace bench
