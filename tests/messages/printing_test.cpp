// What people and logs are shown.
#include <gtest/gtest.h>

#include <set>
#include <sstream>

#include <orv/orv.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"

namespace orv::test {
namespace {

template <class T>
std::string printed(const T& value) {
  return (std::ostringstream() << value).str();
}

TEST(Printing, ShowsValuesAndErrors) {
  const DecodeError error = Group::parse("\x12\x05").error();
  const StreamError streamError{
      .cause = StreamError::Cause::malformedMessage, .offset = 7, .decodeError = error};
  const std::pair<std::string, const char*> cases[] = {
      {printed(Text("zo\u00EB\n")), "zo\u00EB\n"},
      {printed(ByteBuffer("\x0a\x00\xff")), "0a00ff"},
      {printed(ByteBuffer()), ""},
      {printed(VessaSessionMessageType::groupMessage), "groupMessage"},
      {printed(VessaSessionMessageType::UNRECOGNIZED(-7)), "-7"},
      {printed(error), "orv.Group.memberAdded: length 5 runs 5 bytes past the end, at byte 1"},
      {printed(error.cause), "length runs past the end"},
      {printed(error.path), "orv.Group.memberAdded"},
      {printed(streamError), "orv.Group.memberAdded: length 5 runs 5 bytes past the end, at byte 7"},
      {printed(streamError.cause), "malformed message"},
      {printed(EncodeError::bufferTooSmall), "the buffer is too small for the encoding"},
      {printed(Text::checked("ab\xff").error()), "ill-formed UTF-8 at byte 2"},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(text, expected);
  std::ostringstream padded;
  padded << '[';
  padded.width(5);
  padded << ByteBuffer("\x01") << ']';
  EXPECT_EQ(padded.str(), "[   01]");
  // A test that fails shows them alike:
  EXPECT_EQ(::testing::PrintToString(Member()), "orv.Member { }");
  EXPECT_EQ(::testing::PrintToString(ByteBuffer("\x01\x02")), "0102");
}

TEST(Printing, SaysTheCauseWhereAValueIsAskedForInVain) {
  const auto messageOf = [](auto ask) -> std::string {
    try {
      (void)ask();
    } catch (const std::exception& exception) {
      return exception.what();
    }
    return "nothing was thrown";
  };
  EXPECT_EQ(messageOf([] { return Group::parse("\x12\x05").value(); }),
            "orv.Group.memberAdded: length 5 runs 5 bytes past the end, at byte 1");
  EXPECT_EQ(messageOf([] { return Member().merge("\x0a").value(); }),
            "orv.Member.handle: the input ends inside a record, at byte 1");
  EXPECT_EQ(messageOf([] { return Text::checked("ab\xff").value(); }), "ill-formed UTF-8 at byte 2");
  Group group;
  group.mutableMemberLeft();
  EXPECT_EQ(messageOf([&] { return group.serializeInto({}).value(); }),
            "the buffer is too small for the encoding");
  EXPECT_EQ(messageOf([] {
              return DelimitedReader([](std::span<std::byte>) { return std::ptrdiff_t{-1}; }).next().value();
            }),
            "the stream could not be read, at byte 0");
  try {
    (void)Group::parse("\x12\x05").value();
  } catch (const std::bad_expected_access<DecodeError>& exception) {
    EXPECT_EQ(exception.error().cause, DecodeCause::lengthOverrun);
    const auto copy = exception;
    EXPECT_STREQ(copy.what(), exception.what());
  }
}

TEST(Printing, ShowsAMessageOnOneLineAsTheOfficialPrinterDoes) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(50); round > 0 && !HasFailure(); --round) {
      const std::string bytes = randomEncoding(type->fullName(), random);
      const auto official = newOfficial(type->fullName());
      ASSERT_TRUE(official->ParseFromString(bytes));
      const std::string fields = official->ShortDebugString();
      EXPECT_EQ(type->parse(bytes).value()->printed(),
                std::string(type->fullName()) + " { " + fields + (fields.empty() ? "}" : " }"))
          << toHex(bytes);
    }
  }
}

// Tokens, keys, sealed bytes, and what holds any of them.
TEST(Printing, KnowsWhatIsSecret) {
  const std::set<std::string> expected{
      "orv.SessionMessage.data",        "orv.ConnectionResponse.Content.ApprovalContent.invitationData",
      "orv.JoinRequest.publicKey",      "orv.JoinRequest.encryptedData",
      "orv.JoinResponse.encryptedData", "orv.Member.tokenID",
  };
  std::set<std::string> secrets;
  for (const MessagePointer& type : allMessages()) {
    for (const FieldDescriptor& field : type->descriptor().fields) {
      if (field.isSecret) secrets.insert(std::string(type->fullName()) + '.' + std::string(field.name));
    }
  }
  EXPECT_EQ(secrets, expected);
}

TEST(Printing, KeepsSecretsOutOfLogs) {
  const struct {
    const char* message;
    std::string_view input;
    const char* log;
  } cases[] = {
      {"Member", "", "orv.Member { }"},
      {"Member", "0A 01 61 12 01 74", "orv.Member { handle: \"a\" tokenID: <redacted> }"},
      {"Member", "12 00", "orv.Member { tokenID: <redacted> }"},
      {"Member", "0A 01 0A 48 07 4A 02 08 01", "orv.Member { handle: \"\\n\" 9: <redacted> 9: <redacted> }"},
      {"Group", "0A 10 12 06 0A 01 61 12 01 74 12 06 0A 01 62 12 01 75",
       "orv.Group { initialize { members { handle: \"a\" tokenID: <redacted> } "
       "members { handle: \"b\" tokenID: <redacted> } } }"},
      {"SessionMessage", "08 01 10 05 1A 01 61",
       "orv.SessionMessage { version: 1 type: groupMessage data: <redacted> }"},
  };
  for (const auto& row : cases)
    EXPECT_EQ(messageNamed(row.message).parse(hex(row.input)).value()->redactedDescription(), row.log);
}

}  // namespace
}  // namespace orv::test
