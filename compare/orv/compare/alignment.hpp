// Which items of two lists belong together.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace orv::inline v0::compare {

// What tells an item from others, as hashes: all of it, and what it resembles others in.
struct AlignmentKey {
  std::uint64_t contents;
  std::uint64_t shape;
};

// The places of two items that belong together; an item that only one list has stands alone.
struct AlignedPair {
  std::optional<std::size_t> before;
  std::optional<std::size_t> after;

  friend bool operator==(const AlignedPair&, const AlignedPair&) = default;
};

// Pairs the items in the order of both lists, each item once. Equal items come first: a longest common subsequence
// by E. W. Myers, "An O(ND) Difference Algorithm and Its Variations", Algorithmica 1 (1986), in stretches of a
// bounded number of edits, so that time grows linearly with lists that have nothing in common. What stands between
// them is paired likewise by shape, and what is left there in its order.
std::vector<AlignedPair> align(std::span<const AlignmentKey> before, std::span<const AlignmentKey> after);

}  // namespace orv::inline v0::compare
