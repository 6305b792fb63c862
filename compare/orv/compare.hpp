// Where two messages differ.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include <orv/compare/leaf.hpp>

namespace orv::inline v0::compare {

// One value that is not the same in both messages.
struct Difference {
  enum class Kind : std::uint8_t { changed, removed, added };

  Kind kind;
  std::string path;  // "initialize.members[1].handle"
  // The values as text for people; empty on the side that has none. Long values are shown from a little
  // before where they differ.
  std::string before;
  std::string after;
};

// Between two messages that were taken apart, in the order of the fields.
std::vector<Difference> differencesOfLeaves(std::span<const Leaf> before, std::span<const Leaf> after);

// By the messages' own equality: no differences when the messages are equal, and at least one when they are
// not.
template <class M>
std::vector<Difference> differences(const M& before, const M& after) {
  if (before == after) return {};
  return differencesOfLeaves(LeafCollector::collect(before), LeafCollector::collect(after));
}

}  // namespace orv::compare
