// Writes streams of messages, each behind its length as a varint.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <expected>
#include <string>
#include <string_view>

#include <orv/encode_error.hpp>
#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

// What stands before a message in a stream: the number of its bytes, as a varint. For writev, and whoever else
// writes a message from where it is.
class DelimitedHeader {
 public:
  // For a message of so many bytes, below 2^31.
  explicit DelimitedHeader(std::size_t messageSizeInBytes);

  const std::byte* data() const ORV_BOUND { return bytes_.data(); }
  std::size_t size() const { return size_; }
  const std::byte* begin() const ORV_BOUND { return data(); }
  const std::byte* end() const ORV_BOUND { return data() + size(); }

 private:
  std::array<std::byte, 5> bytes_{};
  std::uint8_t size_ = 0;
};

// Appends the number of bytes as a varint, and the bytes, which may be the output's own. It fails only above
// 2^31-1 bytes. After an error nothing is appended.
[[nodiscard]] std::expected<void, EncodeError> appendDelimited(std::string_view bytes, std::string& output);

// Appends a message behind its length. After an error nothing is appended.
template <class M>
requires requires(const M& message) { message.serialize(); }
[[nodiscard]] std::expected<void, EncodeError> appendDelimited(const M& message, std::string& output) {
  const auto bytes = message.serialize();
  if (!bytes) return std::unexpected(bytes.error());  // not covered: by orv_size_tests
  return appendDelimited(std::string_view(*bytes), output);
}

}  // namespace orv
