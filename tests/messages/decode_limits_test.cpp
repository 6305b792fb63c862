// What reading may cost, and what it costs.
#include <gtest/gtest.h>

#include <orv/orv.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

// Every way to read, which must end alike; the error's message, or nothing.
template <class M>
std::string outcome(const std::string& bytes, const DecodeLimits& limits) {
  const auto said = [](const auto& result) { return result ? "" : result.error().message(); };
  const std::span<const std::byte> input = std::as_bytes(std::span(bytes));
  const std::string parsed = said(M::parse(bytes, limits));
  M merged, replaced, decoded;
  EXPECT_EQ(said(merged.merge(bytes, limits)), parsed);
  EXPECT_EQ(said(replaced.reparse(bytes, limits)), parsed);
  BinaryDecoder decoder(input, limits);
  EXPECT_EQ(said(decoded.decodeMessage(decoder)), parsed);
  EXPECT_EQ(merged, decoded);
  EXPECT_EQ(replaced, decoded);
  return parsed;
}

std::string outcome(std::string_view message, const std::string& bytes, const DecodeLimits& limits) {
  std::string found = "no such message";
  AllMessages::forEach([&]<class M>() {
    if (M::protoMessageName.substr(4) == message) found = outcome<M>(bytes, limits);
  });
  return found;
}

TEST(DecodeLimits, EndTheReadingWhereTheyArePassed) {
  const std::string repeatedHex = repeated("12 00 ", 20);
  const struct {
    const char* name;
    const char* message;
    std::string input;
    DecodeLimits limits;  // one less than the input needs
    std::size_t DecodeLimits::*limit;
    const char* error;
  } cases[] = {
      {"input",
       "Group",
       "12 00",
       {.inputBytes = 1},
       &DecodeLimits::inputBytes,
       "orv.Group: more bytes of input than the limit allows, at byte 1"},
      {"a list",
       "Group.Initialization",
       "12 00 12 00 12 00",
       {.listElements = 2},
       &DecodeLimits::listElements,
       "orv.Group.Initialization.members: more elements of lists than the limit allows, at byte 4"},
      {"a first element",
       "Group.Initialization",
       "12 00",
       {.listElements = 0},
       &DecodeLimits::listElements,
       "orv.Group.Initialization.members: more elements of lists than the limit allows, at byte 0"},
      {"a long list",
       "Group.Initialization",
       repeatedHex,
       {.listElements = 19},
       &DecodeLimits::listElements,
       "orv.Group.Initialization.members: more elements of lists than the limit allows, at byte 38"},
      {"a list in runs",
       "JoinResponse.Content.ApprovalContent",
       "12 01 61 0A 00 12 01 62 0A 00 12 01 63",
       {.listElements = 2},
       &DecodeLimits::listElements,
       "orv.JoinResponse.Content.ApprovalContent.memberHandles: more elements of lists than the limit "
       "allows, "
       "at byte 10"},
      {"a list in payloads that are merged",
       "Group",
       "0A 04 12 00 12 00 0A 02 12 00",
       {.listElements = 2},
       &DecodeLimits::listElements,
       "orv.Group.initialize.members: more elements of lists than the limit allows, at byte 8"},
      {"lists that are dropped",
       "Group",
       "0A 02 12 00 22 00 0A 02 12 00",
       {.listElements = 1},
       &DecodeLimits::listElements,
       "orv.Group.initialize.members: more elements of lists than the limit allows, at byte 8"},
      {"unknown fields",
       "Group",
       "28 01 28 02",
       {.unknownFieldBytes = 3},
       &DecodeLimits::unknownFieldBytes,
       "orv.Group.5: more bytes of unknown fields than the limit allows, at byte 2"},
      {"unknown fields of nested messages",
       "Group.MemberAdded",
       "1A 00 12 02 18 01",
       {.unknownFieldBytes = 3},
       &DecodeLimits::unknownFieldBytes,
       "orv.Group.MemberAdded.member.3: more bytes of unknown fields than the limit allows, at byte 4"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    const std::string bytes = hex(row.input);
    EXPECT_EQ(outcome(row.message, bytes, row.limits), row.error);
    DecodeLimits enough = row.limits;
    ++(enough.*row.limit);
    EXPECT_EQ(outcome(row.message, bytes, enough), "");
    EXPECT_EQ(outcome(row.message, bytes, DecodeLimits()), "");
  }
}

TEST(DecodeLimits, EndTheReadingWhereItIsTooDeep) {
  const std::string member = hex("12 02 12 00"), groups = hex("2B 2B 2C 2C");
  EXPECT_EQ(outcome<Group>(member, {.nesting = 1}),
            "orv.Group.memberAdded.member: messages and groups nested deeper than 1, at byte 2");
  EXPECT_EQ(outcome<Group>(groups, {.nesting = 1}),
            "orv.Group.5: messages and groups nested deeper than 1, at byte 1");
  EXPECT_EQ(outcome<Group>(hex("08 01 12 00"), {.nesting = 0}),
            "orv.Group.memberAdded: messages and groups nested deeper than 0, at byte 2");
  for (const std::uint8_t nesting : std::initializer_list<std::uint8_t>{2, 100, 255})
    EXPECT_EQ(outcome<Group>(member + groups, {.nesting = nesting}), "");
  EXPECT_NE(outcome<Group>(hex("2B*101 2C*101"), {.nesting = 255}), "");
}

TEST(DecodeLimits, HoldForEachMessageOfAStream) {
  std::string stream = repeated(hex("04 12 00 12 00"), 3) + hex("06 12 00 12 00 12 00 00");
  const DecodeLimits limits{.listElements = 2};
  const auto expectRefusalOfTheFourth = [](auto& source) {
    for (int message = 0; message < 3; ++message)
      EXPECT_TRUE(source.template read<Group::Initialization>().value());
    const auto refused = source.template read<Group::Initialization>();
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error().decodeError->cause, DecodeCause::tooManyElements);
    EXPECT_TRUE(source.template read<Group::Initialization>().value().has_value());
  };
  DelimitedParser parser(limits);
  parser.push(stream);
  expectRefusalOfTheFourth(parser);
  DelimitedReader reader(
      [&](std::span<std::byte> room) {
        const std::size_t count = stream.copy(reinterpret_cast<char*>(room.data()), room.size());
        stream.erase(0, count);
        return static_cast<std::ptrdiff_t>(count);
      },
      limits);
  expectRefusalOfTheFourth(reader);
}

TEST(DecodeLimits, LetNothingBeAllocatedForWhatLiesBeyond) {
  const std::string members = repeated(hex("12 00"), 1'000'000), unknown = repeated(hex("28 01"), 1'000'000);
  const DecodeLimits limits{.listElements = 100, .unknownFieldBytes = 100};
  const HeapMeter meter;
  EXPECT_FALSE(Group::Initialization::parse(members, limits));
  EXPECT_LT(meter.totalBytes(), 120 * sizeof(Member));
  EXPECT_FALSE(Group::parse(unknown, limits));
  EXPECT_FALSE(Group::parse(members, {.inputBytes = 1'000'000}));
  EXPECT_LT(meter.totalBytes(), 120 * sizeof(Member) + 1000);
}

TEST(DecodeLimits, AreFarAboveThePeakWhateverTheOrderOfArrival) {
  // The peak of reading stays within one and a half times what is then held.
  const std::string large(100'000, 'x');
  const struct {
    const char* name;
    std::string input;
  } cases[] = {
      {"a list in one run", record(1, repeated(hex("12 00"), 100'000))},
      {"a list in runs of nine", record(1, repeated(repeated(hex("12 00"), 9) + hex("0A 00"), 10'000))},
      {"a list in runs of one", record(1, repeated(hex("12 00 18 01"), 100'000))},
      {"a list in many payloads", repeated(hex("0A 02 12 00"), 100'000)},
      {"a list in payloads of growing size",
       [] {
         std::string bytes;
         for (std::size_t count = 1; count < 300; ++count) bytes += record(1, repeated(hex("12 00"), count));
         return bytes;
       }()},
      {"unknown fields between others", repeated(hex("28 01 22 00"), 100'000)},
      {"a text that is replaced by a longer one", record(1, record(1, large) + record(1, large + "x"))},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    const HeapMeter meter;
    const auto group = Group::parse(row.input);
    ASSERT_TRUE(group);
    EXPECT_LE(meter.peakBytes(), meter.liveBytes() * 3 / 2 + 4096);  // a large block is whole pages
  }
}

}  // namespace
}  // namespace orv::test
