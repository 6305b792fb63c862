// What reading may cost.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>

namespace orv::inline v0 {

// How much a program takes from those that it does not trust. The defaults are for a server that reads messages of
// strangers; what reading takes at most with them stands in SECURITY.md. Past a limit reading ends with an error of
// its own cause, and nothing is allocated for what lies beyond.
struct DecodeLimits {
  std::size_t inputBytes = std::size_t{64} << 20;  // of one message
  // Elements that lists are given room for, all lists of a message together. A list that one nested message after
  // the other adds to is given room for up to twice what it holds.
  std::size_t listElements = 1'000'000;
  std::size_t unknownFieldBytes = std::size_t{16} << 20;  // of a message and those in it together
  std::uint8_t nesting = 100;  // of messages and groups; more than 100 is never allowed

  // Those of the format alone, which hold where no limits are given.
  static constexpr DecodeLimits none() {
    constexpr std::size_t unlimited = std::numeric_limits<std::size_t>::max();
    return {.inputBytes = unlimited, .listElements = unlimited, .unknownFieldBytes = unlimited};
  }
};

}  // namespace orv::inline v0
