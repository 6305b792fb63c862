#include <gtest/gtest.h>

#include <algorithm>

#include <orv/group.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/properties.hpp"
#include "tests/testing/wire_cases.hpp"

namespace orv::test {
namespace {

TEST(Encodings, AreReadAndWrittenByTheRules) {
  for (const ReadCase& row : readCases()) {
    SCOPED_TRACE(row.name);
    const AnyMessage& type = messageNamed(row.message);
    const auto message = type.parse(hex(row.input));
    ASSERT_TRUE(message) << message.error().message();
    EXPECT_EQ(encoded(**message), toHex(hex(row.encodedAgain)));
    EXPECT_EQ(faultOfReading(type, hex(row.input)), "");
    EXPECT_EQ(**message == type, row.encodedAgain.empty());
  }
}

TEST(Encodings, AreRefusedWithCauseOffsetAndPath) {
  for (const RefusedCase& row : refusedCases()) {
    SCOPED_TRACE(row.name);
    const AnyMessage& type = messageNamed(row.message);
    const auto message = type.parse(hex(row.input));
    ASSERT_FALSE(message);
    EXPECT_EQ(message.error().message(), row.error);
    EXPECT_EQ(faultOfReading(type, hex(row.input)), "");
  }
}

TEST(Encodings, AreRefusedByEveryMessageWhereverTheFaultStands) {
  const struct {
    const char* name;
    std::string before;
  } places[] = {{"first", ""}, {"later", hex("7A 01 61 78 80 00")}, {"in a group", hex("7B 79 01*8 73")}};
  for (const MalformedCase& row : malformedCases()) {
    for (const auto& place : places) {
      for (const MessagePointer& type : allMessages()) {
        SCOPED_TRACE(std::string(row.name) + ", " + place.name + ", in " + std::string(type->fullName()));
        const auto message = type->parse(place.before + hex(row.input));
        ASSERT_FALSE(message);
        EXPECT_EQ(describe(message.error().cause), describe(row.cause));
        EXPECT_EQ(message.error().offset, place.before.size() + row.offset);
      }
    }
    SCOPED_TRACE(std::string(row.name) + ", in a nested message");
    const auto group =
        Group::parse(record(1, record(2, hex(row.input)) + record(1, "behind")) + hex("12 00"));
    ASSERT_FALSE(group);
    EXPECT_EQ(describe(group.error().cause), describe(row.cause));
    EXPECT_EQ(group.error().offset, 4 + row.offset);
    EXPECT_TRUE(group.error().message().starts_with("orv.Group.initialize.members"));
  }
}

TEST(Encodings, ThatAreCutAreRefusedUnlessARecordEndsThere) {
  // Each offset in `ends` is one where a record of the outermost message ends.
  const struct {
    std::string_view input;
    std::vector<std::size_t> ends;
  } cases[] = {
      {"12 0F 0A 05 67*5 12 06 0A 04 61 62 63 64 2A 02 61 62 2D 01*4 29 01*8 28 80 80 01 A8 80 00 05",
       {0, 17, 21, 26, 35, 39, 43}},
      {"2B 2B 28 05 2C 2A 01 61 2C 0A 02 12 00 0A 02 12 00", {0, 9, 13, 17}},
  };
  for (const auto& row : cases) {
    const std::string whole = hex(row.input);
    for (std::size_t size = 0; size <= whole.size(); ++size) {
      const bool isWhole = std::ranges::find(row.ends, size) != row.ends.end();
      EXPECT_EQ(Group::parse(whole.substr(0, size)).has_value(), isWhole) << "cut to " << size;
    }
  }
}

TEST(Encodings, ThatFailLeaveWhatWasReadBefore) {
  const struct {
    const char* name;
    std::string_view message, held, input, left;
  } cases[] = {
      {"a text", "Member", "0A 01 61", "0A 02 62 FF", "0A 01 61"},
      {"a present text", "Member", "12 01 61", "12 05 62", "12 01 61"},
      {"an absent text", "Member", "", "12 01 FF", ""},
      {"bytes", "JoinRequest", "0A 01 61", "0A 05 62", "0A 01 61"},
      {"a number", "SessionMessage", "08 01", "08 80", "08 01"},
      {"an absent number", "SessionMessage", "", "08 80", ""},
      {"an enumeration", "SessionMessage", "10 03", "10 80*10", "10 03"},
      {"a flag", "JoinRequest.Content", "28 01", "28", "28 01"},
      {"fields before the failing one", "SessionMessage", "10 03", "08 01 28 07 10 80", "08 01 10 03 28 07"},
      {"a list of texts", "JoinResponse.Content.ApprovalContent", "12 01 61", "12 01 62 12 01 FF",
       "12 01 61 12 01 62"},
      {"a list of messages", "Group.Initialization", "12 00", "12 03 0A 01 62 12 04 0A 01 63 0A",
       "12 00 12 03 0A 01 62"},
      {"a nested message", "Group.MemberAdded", "12 03 0A 01 61", "12 05 0A 01 62 12 05", "12 03 0A 01 61"},
      {"a nested message that begins to differ", "Group.MemberAdded", "12 03 0A 01 61", "12 04 1A 00 12 05",
       "12 03 0A 01 61"},
      {"an absent nested message", "Group.MemberAdded", "", "12 05 0A 01 62 12 05", ""},
      {"a oneof that is unset", "Group", "", "0A 04 12 00 12 05", ""},
      {"a oneof that holds the case", "Group", "0A 02 12 00", "0A 04 12 00 12 05", "0A 02 12 00"},
      {"a oneof that holds another case", "Group", "0A 02 12 00", "22 02 10 80", "0A 02 12 00"},
      {"a message in a oneof", "Group", "12 05 12 03 0A 01 61", "12 09 0A 01 41 12 04 0A 01 62 12",
       "12 05 12 03 0A 01 61"},
      {"a list in a oneof", "JoinResponse.Content", "22 03 12 01 61", "22 06 12 01 62 12 01 FF",
       "22 03 12 01 61"},
      {"unknown fields", "Group", "28 01", "28 02 28 80", "28 01 28 02"},
      {"an unknown group", "Group", "28 01", "2B 28 02", "28 01"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    const MessagePointer message = messageNamed(row.message).parse(hex(row.held)).value();
    EXPECT_FALSE(message->merge(hex(row.input)));
    EXPECT_EQ(encoded(*message), toHex(hex(row.left)));
  }
}

TEST(Encodings, AreDescribedByNameAndByNumber) {
  const struct {
    std::string_view message, input, text;
  } cases[] = {
      {"Group", "", ""},
      {"SessionMessage", "08 02 10 03 1A 03 00 FF 22",
       "version: 2\ntype: connectionRequest\ndata: \"\\000\\377\\\"\"\n"},
      {"SessionMessage", "10 09", "type: 9\n"},
      {"SessionMessage", "10 FF*9 01", "type: -1\n"},
      {"JoinRequest.Content", "28 00", "wantsTokenURI: false\n"},
      {"Member", "0A 03 C3 A9 27 12 04 09 0A 0D 5C",
       "handle: \"\\303\\251\\'\"\ntokenID: \"\\t\\n\\r\\\\\"\n"},
      {"Group", "0A 06 12 02 0A 00 12 00", "initialize {\n  members {\n  }\n  members {\n  }\n}\n"},
      {"JoinResponse.Content", "22 06 12 01 61 12 01 62",
       "approved {\n  memberHandles: \"a\"\n  memberHandles: \"b\"\n}\n"},
      {"Member", "18 FF*9 01 1D 01 00 00 00 19 02 00*7",
       "3: 18446744073709551615\n3: 0x00000001\n3: 0x0000000000000002\n"},
      {"Member", "1A 02 08 01 1A 02 FF 01 1A 00", "3 {\n  1: 1\n}\n3: \"\\377\\001\"\n3: \"\"\n"},
      {"Member", "1B 08 01 1A 00 1C", "3 {\n  1: 1\n  3: \"\"\n}\n"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.input);
    EXPECT_EQ(messageNamed(row.message).parse(hex(row.input)).value()->debugDescription(), row.text);
  }
}

TEST(Encodings, FillExactlyTheBufferTheyNeed) {
  // One whose nested length takes two bytes, and whose text is in the heap, among others.
  const std::string inputs[] = {
      hex("28 01"), record(2, hex("0A 03 01 02 03 12 05 0A 03 61 62 63")),
      record(1, record(2, record(1, "x"))),
      record(1, record(2, record(1, std::string(127, 'x'))) + record(2, record(2, std::string(40, 'y')))),
      record(4, record(1, std::string(39, 'u')) + hex("10 01")) + record(16, "unknown")};
  for (const std::string& input : inputs) {
    const Group group = Group::parse(input).value();
    for (std::size_t size = 0; size <= input.size() + 50; ++size) {
      // Sanitizers see writes behind its end.
      std::vector<std::byte> buffer(size, std::byte{0xEE});
      const auto written = group.serializeInto(buffer);
      if (size < input.size()) {
        EXPECT_EQ(written, std::unexpected(EncodeError::bufferTooSmall));
        EXPECT_EQ(std::ranges::count(buffer, std::byte{0}), static_cast<std::ptrdiff_t>(size));
      } else {
        EXPECT_EQ(written, input.size());
        EXPECT_TRUE(
            std::ranges::equal(std::as_bytes(std::span(input)), std::span(buffer).first(input.size())));
        // Nothing of other contents is left behind it.
        for (const std::byte behind : std::span(buffer).subspan(input.size()))
          EXPECT_TRUE(behind == std::byte{0} || behind == std::byte{0xEE});
      }
    }
  }
}

}  // namespace
}  // namespace orv::test
