// Bytes written down in tests.
#pragma once

#include <cassert>
#include <charconv>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace orv::test {

// Pairs of hexadecimal digits, with spaces anywhere between them; "2B*100" stands for a hundred bytes 2B.
inline std::string hex(std::string_view digits) {
  std::string bytes;
  const char* at = digits.data();
  const char* const end = at + digits.size();
  while (at != end) {
    if (*at == ' ') {
      ++at;
      continue;
    }
    unsigned value = 0;
    [[maybe_unused]] const auto pair = std::from_chars(at, at + 2, value, 16);
    assert(pair.ptr == at + 2);
    at += 2;
    std::size_t count = 1;
    if (at != end && *at == '*') at = std::from_chars(at + 1, end, count).ptr;
    bytes.append(count, static_cast<char>(value));
  }
  return bytes;
}

inline std::string toHex(std::string_view bytes) {
  std::string digits;
  for (const char byte : bytes) {
    if (!digits.empty()) digits += ' ';
    digits += "0123456789ABCDEF"[static_cast<unsigned char>(byte) >> 4];
    digits += "0123456789ABCDEF"[byte & 0xF];
  }
  return digits;
}

// A message's encoding.
std::string encoded(const auto& message) { return toHex(message.serialize().value()); }

inline std::string repeated(std::string_view bytes, std::size_t count) {
  std::string all;
  all.reserve(bytes.size() * count);
  for (; count > 0; --count) all += bytes;
  return all;
}

inline std::string varint(std::uint64_t value) {
  std::string bytes;
  for (; value >= 0x80; value >>= 7) bytes += static_cast<char>(value | 0x80);
  return bytes + static_cast<char>(value);
}

// A length-delimited record.
inline std::string record(std::uint32_t number, std::string_view body) {
  return varint(number << 3 | 2) + varint(body.size()) + std::string(body);
}

}  // namespace orv::test
