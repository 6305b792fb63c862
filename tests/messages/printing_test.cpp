// What people and logs are shown.
#include <gtest/gtest.h>

#include <set>
#include <sstream>

#include <orv/orv.hpp>
#include <orv/text_renderer.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/heap.hpp"
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
      {printed(DecodeError()), "the input ends inside a record, at byte 0"},
      {printed(FieldPath()), ""},
      {printed(EncodeError::bufferTooSmall), "the buffer is too small for the encoding"},
      {printed(EncodeError::tooLarge), "the encoding would have more than 2^31-1 bytes"},
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

TEST(Printing, CutsWhatIsTooLongAndLetsItCostNothing) {
  const std::string unknownBody = record(9, repeated(hex("08 01"), 100) + "\x07");
  const std::string cases[] = {
      "",
      hex("0A 0A 12 05 0A 01 61 18 01 0A 01 62"),       // a text, a member, unknown fields in it
      hex("0A 06 12 02 0A 00 12 00 2B 33 34 2C"),       // lists, groups
      unknownBody + hex("48 01"),                       // unknown bytes, taken for a message up to their end
      record(9, record(1, "\x08\x01") + hex("10 02")),  // and those that are one
      record(1, record(1, std::string(10'000, 'x'))),
  };
  for (const std::string& bytes : cases) {
    SCOPED_TRACE(toHex(bytes.substr(0, 100)));
    const Group group = Group::parse(bytes).value();
    std::string reversible;
    TextRenderer small(reversible, {.isReversible = true, .maximumSizeInBytes = 5});
    EXPECT_TRUE(group.traverse(small));
    EXPECT_LE(reversible.size(), std::string_view("12345…").size());
    for (const bool isOneLine : {false, true}) {
      const auto rendered = [&](std::size_t maximum) {
        std::string text = "before ";
        TextRenderer renderer(text, {.isOneLine = isOneLine, .maximumSizeInBytes = maximum});
        EXPECT_TRUE(group.traverse(renderer));
        EXPECT_EQ(renderer.isCut(), text.ends_with("…"));
        return text.substr(7);
      };
      const std::string whole = rendered(SIZE_MAX);
      const std::size_t step = whole.size() > 1000 ? 997 : 1;
      for (std::size_t maximum = 0; maximum < whole.size(); maximum += step)
        EXPECT_EQ(rendered(maximum), whole.substr(0, maximum) + "…");
      EXPECT_EQ(rendered(whole.size()), whole);
    }
  }
}

// Values are escaped; only the names of one's own messages may be other than ASCII.
class OwnMessage final : public Message<OwnMessage> {
 public:
  static constexpr std::string_view protoMessageName = "test.OwnMessage";

 private:
  friend Message;
  bool flag_ = true;
  static constexpr std::tuple fields{field<&OwnMessage::flag_>(1, "f\u00FCr")};
};

TEST(Printing, ShowsByNumberWhatStandsInNoMessage) {
  for (const bool hidesSecrets : {false, true}) {
    std::string text;
    TextRenderer renderer(text, {.isOneLine = true, .hidesSecrets = hidesSecrets});
    EXPECT_TRUE(renderer.visitAnyValue(true, 7));
    EXPECT_TRUE(renderer.visitSingularMessageField(Member(), 8));
    EXPECT_EQ(text, hidesSecrets ? "7: <redacted> 8: <redacted> " : "7: true 8 { } ");
  }
}

TEST(Printing, CutsBetweenCharacters) {
  struct Renderer : TextRenderer {
    using TextRenderer::TextRenderer;
  };
  for (const auto& [maximum, expected] : {std::pair(1U, "f…"), {2U, "f…"}, {3U, "f\u00FC…"}}) {
    std::string text;
    Renderer renderer(text, {.maximumSizeInBytes = maximum});
    EXPECT_TRUE(OwnMessage().traverse(renderer));
    EXPECT_EQ(text, expected);
  }
}

TEST(Printing, KeepsLogsShort) {
  // Unknown groups 100 deep cost most, where secrets need not be hidden.
  const std::string bytes =
      repeated(hex("2B*100 2C*100"), 5'000) + repeated(hex("0A 05 12 03 0A 01 61"), 100'000);
  const Group group = Group::parse(bytes).value();
  const HeapMeter meter;
  const auto expectCut = [](std::string_view line, std::size_t size) {
    EXPECT_EQ(line.size(), std::string_view("orv.Group { …").size() + size);
    EXPECT_TRUE(line.starts_with("orv.Group { ") && line.ends_with("…"));
  };
  expectCut(printed(group), longestLine);
  expectCut(group.redactedDescription(), longestLine);
  expectCut(group.redactedDescription(100), 100);
  EXPECT_LT(meter.peakBytes(), 400'000U);
}

}  // namespace
}  // namespace orv::test
