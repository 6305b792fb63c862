// The text format against the Protocol Buffers runtime, over random messages of every type.
#include "tools/orv/messages/text_form.hpp"

#include <google/protobuf/io/tokenizer.h>
#include <google/protobuf/text_format.h>
#include <gtest/gtest.h>

#include <string>

#include <orv/all_messages.hpp>
#include <orv/byte_view.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/random.hpp"
#include "tools/orv/messages/message_value.hpp"

namespace orv::test {
namespace {

constexpr std::size_t roundsPerType = 2000;

const tool::PayloadPairing usualPairing;

TEST(TextForm, IsWrittenAndReadAsByTheOtherRuntime) {
  Random random;
  const std::size_t rounds = Random::rounds(roundsPerType);
  AllMessages::forEach([&]<class M>() {
    SCOPED_TRACE(M::protoMessageName);
    for (std::size_t round = 0; round < rounds && !HasFailure(); ++round) {
      const auto official = newOfficial(M::protoMessageName);
      fillRandomly(*official, random);
      const auto message = M::parse(official->SerializeAsString());
      ASSERT_TRUE(message.has_value());
      EXPECT_EQ(message->debugDescription(), official->DebugString());

      // The parser takes no unknown fields.
      official->DiscardUnknownFields();
      const std::string text = official->DebugString();
      const auto encoding = tool::encodeTextForm(tool::typeOf<M>(), text, usualPairing);
      ASSERT_TRUE(encoding.has_value()) << encoding.error().reason << '\n' << text;
      EXPECT_EQ(*encoding, official->SerializeAsString()) << text;
    }
  });
}

// What a text is read as, encoded, or else where it goes wrong and how.
std::string outcome(const tool::MessageType& type, std::string_view text) {
  const auto encoding = tool::encodeTextForm(type, text, usualPairing);
  if (encoding) return toHex(*encoding);
  const auto& error = encoding.error();
  return std::to_string(error.line) + ':' + std::to_string(error.column) + ": " + error.reason;
}

std::string times(int count, std::string_view piece) {
  std::string all;
  while (count-- > 0) all += piece;
  return all;
}

class SilentErrors final : public google::protobuf::io::ErrorCollector {
  void AddError(int, google::protobuf::io::ColumnNumber, const std::string&) override {}
};

TEST(TextForm, HasThePayloadInItsEnvelope) {
  struct Case {
    std::string_view name;
    std::string text;
    std::string outcome;
  };
  const Case cases[] = {
      {"nothing", "", ""},
      {"payload as bytes", R"(type: groupMessage data: "\"\000")", "10 05 1A 02 22 00"},
      {"payload as a message", "type: groupMessage data { memberLeft {} }", "10 05 1A 02 22 00"},
      {"type behind the payload", "data { memberLeft {} } type: 5", "10 05 1A 02 22 00"},
      {"payload of no fields", "type: joinRequest data {}", "10 01 1A 00"},
      {"connection response", "type: connectionResponse data { denied {} }", "10 04 1A 02 1A 00"},
      {"enumeration without a name", "type: 9", "10 09"},
      {"type behind other payloads", "data { memberLeft { groupUUID: '} type: 3' } } # type: 2\ntype: 5",
       "10 05 1A 0D 22 0B 0A 09 7D 20 74 79 70 65 3A 20 33"},
      {"payload in other brackets", "type: 5; data: < memberLeft: <> >,", "10 05 1A 02 22 00"},
      {"long payload", "type: 5 data { memberLeft { groupUUID: '" + std::string(200, 'a') + "' } }",
       "10 05 1A CE 01 22 CB 01 0A C8 01" + times(200, " 61")},
      {"no type", "version: 1\ndata { }", "2:6: a message, but no \"type\" says which"},
      {"type without a payload", "type: 9 data { }", "1:14: a message, but no \"type\" says which"},
      {"unknown field of the payload", "type: groupMessage\ndata {\n  memberleft {}\n}",
       "3:3: orv.Group has no field \"memberleft\" (did you mean \"memberLeft\"?)"},
      {"unknown field of the envelope", "type: groupMessage\nversoin: 1\ndata {}",
       "2:1: orv.SessionMessage has no field \"versoin\" (did you mean \"version\"?)"},
      {"unknown field behind a closed payload", "data: \"\"\n  x: 1",
       "2:3: orv.SessionMessage has no field \"x\""},
      {"payload that does not end", "type: groupMessage\ndata {",
       "2:7: expected a field or the message's end, found the end"},
      {"payload that is a number", "type: groupMessage data: 1", "1:26: expected a string, found \"1\""},
      {"second member of a oneof", "type: groupMessage data { memberLeft {} initialize {} }",
       "1:41: a second member of a oneof"},
      {"field given twice", "version: 1 version: 1", "1:12: version is there twice"},
      {"no colon", "version 1", "1:9: expected \":\", found \"1\""},
      {"text for a number", "version: é", "1:10: expected a whole number from 0 to 4294967295, found \"é\""},
      {"number too large", "version: 4294967296",
       "1:10: expected a whole number from 0 to 4294967295, found \"4294967296\""},
      {"unknown name", "type: group", "1:7: expected a name or a number of type, found \"group\""},
      {"number for bytes", "data: 1", "1:7: expected a string, found \"1\""},
      {"string without an end", "data: \"a\n\"", "1:9: a string without its closing quotation mark"},
      {"string without an end at the end", "data: \"a", "1:9: a string without its closing quotation mark"},
      {"no escape", R"(data: "\q")", "1:8: an escape that C does not have"},
      {"code point beyond Unicode", R"(data: "\U00110000")", "1:8: an escape that C does not have"},
      {"list without commas", "1: [1 2]", "1:4: expected a number, a string or a message"},
      {"NUL between fields", {"version: 1\n\0", 12}, "2:1: expected a field, found a NUL character"},
      {"NUL in a string", {"data: \"\0\"", 9}, "1:8: a NUL character"},
      {"NUL for a value",
       {"version: \0", 10},
       "1:10: expected a whole number from 0 to 4294967295, found a NUL character"},
      {"ill-formed UTF-8", "type: connectionRequest data {\n  handle: \"a\\377\" }",
       "2:11: ill-formed UTF-8 in handle"},
  };
  for (const Case& each : cases) {
    EXPECT_EQ(outcome(tool::typeOf<SessionMessage>(), each.text), each.outcome) << each.name;
  }
  const std::string error =
      outcome(tool::typeOf<SessionMessage>(), "version: " + std::string(5'000'000, '1'));
  EXPECT_LT(error.size(), 200U) << error;
}

TEST(TextForm, TellsOfIllFormedTextsInLists) {
  const tool::MessageType& type = tool::typeOf<JoinResponse::Content::ApprovalContent>();
  EXPECT_EQ(outcome(type, "memberHandles: [\"a\",\n \"\\300\"]"), "2:2: ill-formed UTF-8 in memberHandles");
  EXPECT_EQ(outcome(type, "memberHandles: [\"a\" \"b\", 'c' 1]"),
            "1:30: expected \",\" or \"]\", found \"1\"");
  EXPECT_EQ(outcome(tool::typeOf<Group>(), "initialize { members {}\n members { tokenID: \"\\200\" } }"),
            "2:21: ill-formed UTF-8 in tokenID");
}

// What is written by hand in many ways is taken, with the same bytes, and refused, as by the other runtime.
TEST(TextForm, IsTakenAndRefusedAsByTheOtherRuntime) {
  struct Case {
    std::string_view type;
    std::string_view text;
  };
  const Case cases[] = {
      {"SessionMessage", "version:1type:groupMessage"},
      {"SessionMessage", "version:1 type:groupMessage"},
      {"SessionMessage", "\v\f\r version : 0x1F ; type : 05 , # comment"},
      {"SessionMessage", "version: 1,; type: 1"},
      {"SessionMessage", ", version: 1"},
      {"SessionMessage", "version: 08"},
      {"SessionMessage", "version: 017"},
      {"SessionMessage", "version: 0x"},
      {"SessionMessage", "version: 0Xff"},
      {"SessionMessage", "version: -1"},
      {"SessionMessage", "version: 1.0"},
      {"SessionMessage", "version: 1e1"},
      {"SessionMessage", "version: 4294967295"},
      {"SessionMessage", "version: [1]"},
      {"SessionMessage", "Version: 1"},
      {"SessionMessage", "type: -1"},
      {"SessionMessage", "type: - 2147483648"},
      {"SessionMessage", "type: 2147483648"},
      {"SessionMessage", "type: \"groupMessage\""},
      {"SessionMessage", "type: GROUPMESSAGE"},
      {"SessionMessage", "data: version: 1"},
      {"SessionMessage", "data: 'a' \"b\"\n'c'"},
      {"SessionMessage",
       R"(data: "\a\b\f\n\r\t\v\\\?\'\"\0\18\1234\777\x1\x41\x4142\u20ac\U0001F600\ud83d\ude00")"},
      {"SessionMessage", R"(data: "\x")"},
      {"SessionMessage", R"(data: "\X41")"},
      {"SessionMessage", R"(data: "\u20a")"},
      {"SessionMessage", R"(data: "\8")"},
      {"SessionMessage", R"(data: "\ud800")"},
      {"SessionMessage", R"(data: "\ude00\ud83d")"},
      {"SessionMessage", "data: 'a\\\nb'"},
      {"SessionMessage", "data: 'a\"b\tc'"},
      {"SessionMessage", "data: ''"},
      {"SessionMessage", "data: `a`"},
      {"SessionMessage", "{ version: 1 }"},
      {"SessionMessage", "version: 1 }"},
      {"SessionMessage", "# nothing but a comment"},
      {"SessionMessage", "[a.b]: 1"},
      {"Group", "memberLeft { usesToken: true }"},
      {"Group", "memberLeft < usesToken: t >"},
      {"Group", "memberLeft < usesToken: t }"},
      {"Group", "memberLeft: { usesToken: 1 }"},
      {"Group", "memberLeft { usesToken: 0x1 }"},
      {"Group", "memberLeft { usesToken: 2 }"},
      {"Group", "memberLeft { usesToken: TRUE }"},
      {"Group", "memberLeft { usesToken: False };"},
      {"Group", "memberLeft { usesToken: f groupUUID: '' }"},
      {"Group", "memberLeft {} memberLeft {}"},
      {"Group", "memberLeft 1"},
      {"Group", "memberLeft {"},
      {"Group", "initialize { members {handle: 'b'} groupUUID: 'a' members {} }"},
      {"Group", "initialize { members [{handle: 'b'}, <>] members: [] members: {handle: ''} }"},
      {"Group", "initialize { members [{},] }"},
      {"Group", "initialize { members [{} {}] }"},
      {"JoinResponse.Content.ApprovalContent", "memberHandles: ['a', 'b' 'c'] memberHandles: 'd'"},
      {"JoinResponse.Content.ApprovalContent", "memberHandles ['a']"},
      {"JoinResponse.Content.ApprovalContent", "memberHandles: []"},
  };
  for (const Case& each : cases) {
    const auto official = newOfficial("orv." + std::string(each.type));
    google::protobuf::TextFormat::Parser parser;
    SilentErrors silent;
    parser.RecordErrorsTo(&silent);
    const bool isTaken = parser.ParseFromString(std::string(each.text), official.get());
    const auto encoding = tool::encodeTextForm(**tool::findMessageType(each.type), each.text, usualPairing);
    EXPECT_EQ(encoding.has_value(), isTaken) << each.text;
    EXPECT_EQ(toHex(encoding.value_or("")), toHex(isTaken ? official->SerializePartialAsString() : ""))
        << each.text;
  }
}

TEST(TextForm, TakesUnknownFieldsByNumber) {
  struct Case {
    std::string_view name;
    std::string_view text;
    std::string_view outcome;
  };
  const Case cases[] = {
      {"varint", "9: 300 handle: 'a'", "0A 01 61 48 AC 02"},
      {"largest varint", "9: 18446744073709551615", "48 FF FF FF FF FF FF FF FF FF 01"},
      {"hexadecimal varint", "9: 0xFF", "48 FF 01"},
      {"64 bits", "9: 0x0000000000000001", "49 01 00 00 00 00 00 00 00"},
      {"32 bits", "9: 0xfffffffe", "4D FE FF FF FF"},
      {"bytes", "9: \"a\\377\"", "4A 02 61 FF"},
      {"message", "9 { 1: 5 2 { 3: '' } }", "4A 06 08 05 12 02 1A 00"},
      {"known number of another wire type", "1: 5", "08 05"},
      {"records", R"([records]: "H\200\000" handle: "a")", "0A 01 61 48 80 00"},
      {"known number", "1: 'a'", "1:1: field 1 is handle"},
      {"known number in records", R"([records]: "\n\001\377")", "1:1: field 1 is handle"},
      {"malformed records", R"([records]: "\n")", "1:1: malformed records: the input ends inside a record"},
      {"number 0", "0: 1", "1:1: no number of a field"},
      {"number too large", "536870912: 1", "1:1: no number of a field"},
      {"name in an unknown message", "9 { handle: 'a' }",
       "1:5: the fields of an unknown one go by their numbers"},
  };
  for (const Case& each : cases) {
    EXPECT_EQ(outcome(tool::typeOf<Member>(), each.text), each.outcome) << each.name;
  }
}

// Random bytes are mostly no messages, so that records are tried in all spellings by hand too.
TEST(TextForm, BringsUnknownFieldsBack) {
  const auto expectBack = [](std::string_view bytes) {
    const auto message = tool::parseMessage(tool::typeOf<Member>(), bytesOf(bytes), usualPairing);
    ASSERT_TRUE(message.has_value()) << toHex(bytes);
    const std::string text = (*message)->text({});
    EXPECT_EQ(outcome(tool::typeOf<Member>(), text), toHex(bytes)) << text;
  };
  for (const std::string_view record :
       {"38 96 01", "45 01 00 00 00", "49 02 00 00 00 00 00 00 00", "52 01 FF", "52 00", "52 02 08 01",
        "5B 08 01 5C", "38 FF FF FF FF FF FF FF FF FF 01", "38 81 00", "B8 00 01", "52 81 00 FF",
        "52 03 08 81 00", "52 02 5B 5C", "52 04 52 02 08 01", "52 05 52 03 08 81 00", "08 05",
        "15 00 00 00 80", "52 03 0A 81 00"})
    expectBack(hex(record));
  Random random;
  for (std::size_t round = 0; round < Random::rounds(roundsPerType); ++round) {
    const auto official = newOfficial("orv.Member");
    fillRandomly(*official, random);
    const auto message = Member::parse(official->SerializeAsString());
    ASSERT_TRUE(message.has_value());
    expectBack(*message->serialize());
  }
}

TEST(TextForm, RefusesDeepNestingInTime) {
  std::string deep = "type: groupMessage data ";
  for (int level = 0; level < 100'000; ++level) deep += "{ 9 ";
  EXPECT_NE(outcome(tool::typeOf<SessionMessage>(), deep), "");
  EXPECT_NE(outcome(tool::typeOf<Group>(), deep), "");
}

}  // namespace
}  // namespace orv::test
