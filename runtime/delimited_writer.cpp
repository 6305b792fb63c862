#include <orv/delimited_writer.hpp>

#include <cassert>
#include <cstring>
#include <functional>

#include <orv/binary_encoder.hpp>

namespace orv::inline v0 {

DelimitedHeader::DelimitedHeader(std::size_t messageSizeInBytes) {
  assert(messageSizeInBytes <= BinaryEncoder::largestEncoding);
  for (std::size_t rest = messageSizeInBytes;; rest >>= 7) {
    bytes_[size_++] = static_cast<std::byte>((rest & 0x7F) | (rest > 0x7F ? 0x80 : 0));
    if (rest <= 0x7F) return;
  }
}

std::expected<void, EncodeError> appendDelimited(std::string_view bytes, std::string& output) {
  if (bytes.size() > BinaryEncoder::largestEncoding)
    return std::unexpected(EncodeError::tooLarge);  // not covered: by orv_size_tests
  // The bytes may be the output's own, which move when it grows.
  const std::size_t before = output.size();
  const bool areOwn = std::greater_equal<>()(bytes.data(), output.data()) &&
                      std::less_equal<>()(bytes.data(), output.data() + before);
  const std::size_t ownAt = areOwn ? static_cast<std::size_t>(bytes.data() - output.data()) : 0;
  const DelimitedHeader header(bytes.size());
  const std::size_t size = before + header.size() + bytes.size();
  output.resize_and_overwrite(size, [&](char* begin, std::size_t) {
    std::memcpy(begin + before, header.data(), header.size());
    if (!bytes.empty())
      std::memcpy(begin + before + header.size(), areOwn ? begin + ownAt : bytes.data(), bytes.size());
    return size;
  });
  return {};
}

}  // namespace orv
