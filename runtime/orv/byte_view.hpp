// The same bytes, looked at as characters or as std::byte.
#pragma once

#include <cstddef>
#include <span>
#include <string_view>

namespace orv::inline v0 {

// Both views are valid as long as the one they are made of.
inline std::span<const std::byte> bytesOf(std::string_view characters) {
  return std::as_bytes(std::span(characters));
}
inline std::string_view charactersOf(std::span<const std::byte> bytes) {
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace orv
