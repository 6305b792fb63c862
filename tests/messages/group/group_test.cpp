#include <orv/group.hpp>

#include <gtest/gtest.h>

#include <orv/join_response.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

TEST(Member, TellsAbsentFromEmpty) {
  Member member;
  member.setHandle("");
  EXPECT_EQ(member, Member());
  member.setTokenID("");
  EXPECT_TRUE(member.hasTokenID());
  EXPECT_EQ(toHex(*member.serialize()), "12 00");
  EXPECT_FALSE(member == Member());
  member.clearTokenID();
  EXPECT_TRUE(member == Member() && member.tokenID().isEmpty());
  member.mutableHandle() += "a";
  member.mutableTokenID() += "t";
  EXPECT_EQ(toHex(*member.serialize()), "0A 01 61 12 01 74");
}

TEST(Member, LendsAndTakesItsUnknownFields) {
  Member member = Member::parse(hex("0A 01 61 18 01")).value();
  const UnknownStorage kept = member.unknownFields();
  member.setUnknownFields({});
  EXPECT_EQ(toHex(*member.serialize()), "0A 01 61");
  member.setUnknownFields(kept);
  EXPECT_EQ(toHex(*member.serialize()), "0A 01 61 18 01");
}

template <class Event>
void expectPresenceOfMember() {
  Event event;
  EXPECT_EQ(event.member(), Member());
  EXPECT_FALSE(event.hasMember());
  event.setMember({});
  EXPECT_TRUE(event.hasMember());
  EXPECT_EQ(toHex(*event.serialize()), "12 00");
  EXPECT_FALSE(event == Event());
  event.clearMember();
  EXPECT_EQ(event, Event());
  event.mutableMember().setHandle("a");
  event.mutableMember().setTokenID("t");
  event.setGroupUuid(ByteBuffer("g"));
  EXPECT_EQ(toHex(*event.serialize()), "0A 01 67 12 06 0A 01 61 12 01 74");
}

TEST(Group, TellsAnAbsentMemberFromADefaultOne) {
  expectPresenceOfMember<Group::MemberAdded>();
  expectPresenceOfMember<Group::MemberRemoved>();
}

TEST(Group, ReadsACaseThatItDoesNotHoldAsDefault) {
  Group group;
  group.setMemberLeft({});
  EXPECT_EQ(group.memberAdded(), Group::MemberAdded());
  EXPECT_TRUE(group.initialize() == Group::Initialization() &&
              group.memberRemoved() == Group::MemberRemoved());
  EXPECT_EQ(toHex(*group.serialize()), "22 00");
  group.setEvent(std::nullopt);
  EXPECT_FALSE(group.memberLeft().usesToken());
  EXPECT_FALSE(group.event());
}

TEST(Group, NamesTheCaseThatItHolds) {
  using Case = Group::EventCase;
  const std::pair<std::string_view, Case> cases[] = {
      {"", Case::none},
      {"0A 00", Case::initialize},
      {"12 00", Case::memberAdded},
      {"1A 00", Case::memberRemoved},
      {"22 00", Case::memberLeft},
  };
  for (const auto& [input, expected] : cases) {
    const Group group = Group::parse(hex(input)).value();
    EXPECT_EQ(group.eventCase(), expected) << input;
    EXPECT_EQ(held<Group::MemberLeft>(group.event()) != nullptr, expected == Case::memberLeft) << input;
  }
  using Content = JoinResponse::Content;
  EXPECT_EQ(Content::parse(hex("1A 00")).value().operationCase(), Content::OperationCase::denied);
  EXPECT_EQ(Content::parse(hex("22 00")).value().operationCase(), Content::OperationCase::approved);
}

TEST(Group, SwitchesItsEventByWriting) {
  Group group;
  group.setInitialize({});
  EXPECT_EQ(toHex(*group.serialize()), "0A 00");
  group.setMemberRemoved({});
  EXPECT_EQ(toHex(*group.serialize()), "1A 00");
  group.mutableInitialize().mutableMembers().emplace_back();
  group.mutableInitialize().mutableMembers().emplace_back();
  EXPECT_EQ(toHex(*group.serialize()), "0A 04 12 00 12 00");
  group.mutableMemberLeft().setUsesToken(true);
  EXPECT_EQ(toHex(*group.serialize()), "22 02 10 01");
  (void)group.mutableMemberAdded();
  EXPECT_EQ(toHex(*group.serialize()), "12 00");
  (void)group.mutableMemberRemoved();
  EXPECT_EQ(toHex(*group.serialize()), "1A 00");
}

TEST(Group, TellsCasesOfEqualContentApart) {
  Group added, removed;
  added.mutableMemberAdded().mutableMember().setHandle("a");
  removed.mutableMemberRemoved().mutableMember().setHandle("a");
  EXPECT_FALSE(added == removed || added.event() == removed.event());
}

TEST(Group, ComparesMembersInOrder) {
  Member a, b;
  a.setHandle("a");
  b.setHandle("b");
  Group::Initialization left, right;
  left.setMembers({a, b});
  right.setMembers({b, a});
  EXPECT_FALSE(left == right);
  EXPECT_EQ(toHex(*left.serialize()), "12 03 0A 01 61 12 03 0A 01 62");
}

TEST(Group, EqualsOneInAnotherNormalFormWhateverDepthTheTextStandsAt) {
  Group composed, decomposed;
  composed.mutableMemberAdded().mutableMember().setTokenID("\u00C5");
  decomposed.mutableMemberAdded().mutableMember().setTokenID("A\u030A");
  EXPECT_EQ(composed, decomposed);
  EXPECT_EQ(composed.hashValue(), decomposed.hashValue());
}

TEST(Group, AllocatesNothingForAUuidAndAHandle) {
  const std::string bytes =
      record(2, record(1, std::string(16, 'u')) + record(2, record(1, std::string(39, 'h'))));
  (void)Group().initialize();  // its default is made once
  const HeapMeter meter;
  Group group;
  ASSERT_TRUE(group.merge(bytes));
  (void)group.initialize();
  EXPECT_EQ(meter.allocations(), 0U);
}

}  // namespace
}  // namespace orv::test
