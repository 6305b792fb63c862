#pragma once

#include <cstddef>
#include <exception>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <tuple>

#include <protozero/buffer_fixed.hpp>
#include <protozero/buffer_string.hpp>

#include "bench/peers/protozero_messages.hpp"
#include "bench/workloads/workloads.hpp"

namespace bench {

// Equal work over a reader and writer for wire data: text checked, unknown fields kept, real presence, owning
// values.
struct Protozero {
  static constexpr std::string_view name = "protozero";
  static constexpr bool checksText = true;
  static constexpr bool keepsUnknownFields = true;
  static constexpr bool reusesMemory = true;
  static constexpr bool equatesNormalForms = false;
  static constexpr std::size_t mostMembers = std::numeric_limits<std::size_t>::max();

  template <Kind kind>
  using Value = std::tuple_element_t<
      static_cast<std::size_t>(kind),
      std::tuple<by_hand::SessionMessage, by_hand::ConnectionRequest, by_hand::ConnectionResponseContent,
                 by_hand::JoinRequest, by_hand::JoinRequestContent, by_hand::JoinResponseContent,
                 by_hand::Group>>;

  static bool decode(auto& value, std::string_view bytes) {
    try {
      by_hand::merge(value, {bytes.data(), bytes.size()});
      return true;
    } catch (const std::exception&) {
      return false;
    }
  }
  // Strings keep their memory through this assignment, lists do not.
  template <class Message>
  static bool decodeAgain(Message& value, std::string_view bytes) {
    value = Message();
    return decode(value, bytes);
  }
  static std::string encode(const auto& value) {
    std::string bytes;
    by_hand::Writer writer(bytes);
    by_hand::writeAll(writer, value);
    return bytes;
  }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    protozero::fixed_size_buffer_adaptor target(buffer.data(), buffer.size());
    by_hand::Writer writer(target);
    by_hand::writeAll(writer, value);
    return target.size();
  }
  static bool equal(const auto& left, const auto& right) { return left == right; }
};

}  // namespace bench
