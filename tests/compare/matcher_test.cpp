#include <orv/testing.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest-spi.h>

#include <orv/group.hpp>

namespace orv::test {
namespace {

Group groupOf(Text handle) {
  Group group;
  group.mutableMemberAdded().mutableMember().setHandle(std::move(handle));
  return group;
}

TEST(EqualsMatcher, TakesWhatIsEqual) {
  EXPECT_THAT(groupOf("zo\u00EB"), orv::testing::equals(groupOf("zoe\u0308")));
  EXPECT_THAT(groupOf("zoe"), ::testing::Not(orv::testing::equals(groupOf("zo\u00EB"))));
  const std::vector<Group> groups{groupOf("anna"), groupOf("ben")};
  EXPECT_THAT(groups, ::testing::Contains(orv::testing::equals(groupOf("ben"))));
}

TEST(EqualsMatcher, SaysWhichFieldsDiffer) {
  Group actual = groupOf("ben");
  actual.mutableMemberAdded().mutableMember().setTokenID("t1");
  Group expected = groupOf("anna");
  expected.mutableMemberAdded().setGroupUuid("id");
  EXPECT_NONFATAL_FAILURE(EXPECT_THAT(actual, orv::testing::equals(expected)),
                          R"(which differs in
memberAdded.groupUUID: nothing instead of "id"
memberAdded.member.handle: "ben" instead of "anna"
memberAdded.member.tokenID: "t1" instead of nothing)");
}

}  // namespace
}  // namespace orv::test
