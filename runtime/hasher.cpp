#include <orv/hasher.hpp>

#define XXH_INLINE_ALL
#include <xxhash.h>

namespace orv::inline v0 {

void Hasher::combine(std::uint64_t value) { state_ = XXH3_64bits_withSeed(&value, sizeof value, state_); }

void Hasher::combine(std::string_view bytes) {
  state_ = XXH3_64bits_withSeed(bytes.data(), bytes.size(), state_ + bytes.size());
}

}  // namespace orv
