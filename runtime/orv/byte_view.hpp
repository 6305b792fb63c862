// The same bytes, looked at as characters or as std::byte.
#pragma once

#include <cstddef>
#include <span>
#include <string_view>

#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

// Both views are valid as long as the one they are made of.
inline std::span<const std::byte> bytesOf(std::string_view characters ORV_BOUND) {
  return std::as_bytes(std::span(characters));
}
inline std::string_view charactersOf(std::span<const std::byte> bytes ORV_BOUND) {
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace orv
