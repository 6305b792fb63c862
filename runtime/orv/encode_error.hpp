// Why a message could not be encoded.
#pragma once

#include <cstdint>
#include <expected>
#include <iosfwd>
#include <string_view>

#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

enum class EncodeError : std::uint8_t {
  bufferTooSmall,  // the caller's buffer cannot hold the encoding
  tooLarge,        // the encoding would have more than 2^31-1 bytes, the most that the format allows
};

// A sentence without its full stop. It lasts as long as the program.
constexpr std::string_view describe(EncodeError error) {
  return error == EncodeError::bufferTooSmall ? "the buffer is too small for the encoding"
                                              : "the encoding would have more than 2^31-1 bytes";
}
std::ostream& operator<<(std::ostream& out, EncodeError error);

}  // namespace orv

template <>
class std::bad_expected_access<orv::EncodeError> : public orv::internal::BadAccess<orv::EncodeError> {
  using BadAccess::BadAccess;
};
