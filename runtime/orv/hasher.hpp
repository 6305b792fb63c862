// Collects what a value is made of into one number.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include <orv/internal/standard.hpp>

namespace orv::inline v0 {

// Feeds bytes and numbers to XXH3 (xxhash.com), each step seeded with the result of the one before. Results
// hold inside one process only: they are neither stored nor sent. A seed of one's own makes them hard to
// predict.
class Hasher {
 public:
  constexpr Hasher() = default;
  constexpr explicit Hasher(std::uint64_t seed) : state_(seed) {}

  void combine(std::uint64_t value);
  // The length counts too: "a", "b" and "ab", "" differ.
  void combine(std::string_view bytes);

  std::uint64_t finish() const { return state_; }

 private:
  std::uint64_t state_ = 0;
};

namespace internal {

// The std::hash of a type that feeds itself into a hasher.
template <class T>
struct StandardHash {
  std::size_t operator()(const T& value) const {
    Hasher hasher;
    value.hash(hasher);
    return static_cast<std::size_t>(hasher.finish());
  }
};

}  // namespace internal

}  // namespace orv
