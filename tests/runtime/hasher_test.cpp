#include <orv/hasher.hpp>

#include <gtest/gtest.h>

#include <set>

namespace orv::test {
namespace {

std::uint64_t hashOf(std::initializer_list<std::string_view> pieces, std::uint64_t seed = 0) {
  Hasher hasher(seed);
  for (const std::string_view piece : pieces) hasher.combine(piece);
  return hasher.finish();
}

TEST(Hasher, TellsPiecesOrderLengthAndSeedApart) {
  const std::set<std::uint64_t> hashes{
      hashOf({}),         hashOf({""}),     hashOf({"", ""}),  hashOf({"a"}),        hashOf({"b"}),
      hashOf({"a", "b"}), hashOf({"ab"}),   hashOf({"ba"}),    hashOf({"ab", ""}),   hashOf({"", "ab"}),
      hashOf({"a"}, 1),   hashOf({"b"}, 1), hashOf({"ab"}, 1), hashOf({"b", "a"}, 0)};
  EXPECT_EQ(hashes.size(), 14U);
  EXPECT_EQ(hashOf({"a", "b"}), hashOf({"a", "b"}));

  Hasher number, other;
  number.combine(std::uint64_t{1});
  other.combine(std::uint64_t{2});
  EXPECT_NE(number.finish(), other.finish());
}

}  // namespace
}  // namespace orv::test
