#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <tuple>

#include <orv/all_messages.hpp>
#include "bench/workloads/workloads.hpp"

namespace bench {

// Our own library.
struct Orv {
  static constexpr std::string_view name = "orv";
  static constexpr bool checksText = true;
  static constexpr bool keepsUnknownFields = true;
  static constexpr bool reusesMemory = true;
  static constexpr bool equatesNormalForms = true;
  static constexpr std::size_t mostMembers = std::numeric_limits<std::size_t>::max();

  template <Kind kind>
  using Value = std::tuple_element_t<
      static_cast<std::size_t>(kind),
      std::tuple<orv::SessionMessage, orv::ConnectionRequest, orv::ConnectionResponse::Content,
                 orv::JoinRequest, orv::JoinRequest::Content, orv::JoinResponse::Content, orv::Group>>;

  static bool decode(auto& value, std::string_view bytes) { return value.merge(bytes).has_value(); }
  static bool decodeAgain(auto& value, std::string_view bytes) { return value.reparse(bytes).has_value(); }
  static std::string encode(const auto& value) { return *value.serialize(); }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    return *value.serializeInto(std::as_writable_bytes(buffer));
  }
  static bool equal(const auto& left, const auto& right) { return left == right; }
  static std::uint64_t hash(const auto& value) { return value.hashValue(); }
  static std::string text(const auto& value) { return value.debugDescription(); }
};

}  // namespace bench
