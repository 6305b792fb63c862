// The forms that a message can be given in.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace orv::tool {

enum class Format : std::uint8_t { binary, hex, base64, text, json };

// In the order of Format, as the options spell them.
inline constexpr std::array<std::string_view, 5> formatNames{"binary", "hex", "base64", "text", "json"};

// Whether the format spells out the binary encoding, byte by byte.
constexpr bool isBytes(Format format) {
  return format == Format::binary || format == Format::hex || format == Format::base64;
}

}  // namespace orv::tool
