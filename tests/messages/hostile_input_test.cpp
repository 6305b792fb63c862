// Input that costs much where something is done in more than linear time or memory.
#include <gtest/gtest.h>

#include <orv/all_messages.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

constexpr std::size_t million = 1'000'000;

TEST(HostileInput, OneofMembersAMillionTimes) {
  const struct {
    const char* name;
    std::string occurrence;
    std::size_t memberCount;  // afterwards
  } cases[] = {
      {"each adds a member", hex("0A 02 12 00"), million},
      {"each adds unknown fields", hex("0A 02 28 01"), 0},
      {"cases alternate", hex("0A 02 12 00 22 02 10 01"), 0},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    const std::string input = repeated(row.occurrence, million);
    const HeapMeter meter;
    const auto group = Group::parse(input);
    ASSERT_TRUE(group);
    EXPECT_EQ(group->initialize().members().size(), row.memberCount);
    // A member takes some hundred bytes and a list doubles as it grows. Copying the payload for each
    // occurrence would come to a million times that.
    EXPECT_LT(meter.peakBytes(), 400 * million);
    EXPECT_LT(meter.totalBytes(), 1000 * million);
    EXPECT_LT(meter.allocations(), 3 * million);
  }
}

TEST(HostileInput, NestedMessageAMillionTimes) {
  const std::string input = repeated(hex("12 02 18 01"), million);
  const HeapMeter meter;
  const auto added = Group::MemberAdded::parse(input);
  ASSERT_TRUE(added);
  EXPECT_EQ(added->member().unknownFields().records().size(), 2 * million);
  EXPECT_LT(meter.totalBytes(), 100 * million);
}

TEST(HostileInput, MembersInManyShortRuns) {
  const std::string input = repeated(hex("12 00 12 00 0A 00"), million);
  const HeapMeter meter;
  EXPECT_EQ(Group::Initialization::parse(input)->members().size(), 2 * million);
  EXPECT_LT(meter.totalBytes(), 1000 * million);
}

TEST(HostileInput, TenMillionNestedGroups) {
  const std::string input(10 * million, '\x2B');
  const HeapMeter meter;
  const auto group = Group::parse(input);
  ASSERT_FALSE(group);
  EXPECT_EQ(group.error().cause, DecodeCause::nestingTooDeep);
  EXPECT_LT(meter.totalBytes(), 1000U);
}

TEST(HostileInput, ManyDeepGroupsInARow) {
  const std::string input = repeated(hex("2B*100 2C*100"), 10'000);
  const auto group = Group::parse(input).value();
  EXPECT_EQ(group.serialize(), input);
  EXPECT_GT(group.debugDescription().size(), input.size());
}

TEST(HostileInput, SixtyFourMebibytesOfUnknownRecords) {
  const std::string input = repeated(hex("28 01"), std::size_t{32} << 20);
  const HeapMeter meter;
  auto group = Group::parse(input);
  ASSERT_TRUE(group);
  EXPECT_EQ(group->unknownFields().records().size(), input.size());
  EXPECT_LT(meter.peakBytes(), 3 * input.size());
  EXPECT_EQ(*group, *Group::parse(input));
  EXPECT_EQ(group->encodedSize(), input.size());
}

TEST(HostileInput, AMebibyteOfMarksOutOfOrder) {
  constexpr std::size_t count = (std::size_t{1} << 20) / 4;
  const std::string input = "a" + repeated("\u0301\u0316", count);
  const std::string ordered = "a" + repeated("\u0316", count) + repeated("\u0301", count);
  const HeapMeter meter;
  const Text text(input), same(ordered), other(ordered + "\u0301");
  EXPECT_EQ(text, same);
  EXPECT_FALSE(text == other);
  Hasher left, right;
  text.hash(left);
  same.hash(right);
  EXPECT_EQ(left.finish(), right.finish());
  EXPECT_LT(meter.peakBytes(), 32 * input.size());
}

TEST(HostileInput, AMebibyteThatIsNoText) {
  const std::string input(std::size_t{1} << 20, '\xFF');
  const HeapMeter meter;
  EXPECT_EQ(Text(input).sizeInBytes(), 3 * input.size());
  EXPECT_LT(meter.peakBytes(), 16 * input.size());
}

TEST(HostileInput, AnnouncedLengthsAllocateNothing) {
  for (const char* const input : {"0A FF FF FF FF 07 12", "2A FF FF FF FF 07", "12 06 0A FF FF FF FF 07"}) {
    const std::string bytes = hex(input);
    const HeapMeter meter;
    EXPECT_FALSE(Group::parse(bytes));
    EXPECT_FALSE(Member::parse(bytes));
    EXPECT_LT(meter.totalBytes(), 1000U);
  }
}

}  // namespace
}  // namespace orv::test
