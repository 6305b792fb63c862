// The text format against the Protocol Buffers runtime, over random messages of every type.
#include "tools/orv/messages/text_form.hpp"

#include <google/protobuf/text_format.h>
#include <gtest/gtest.h>

#include <string>

#include <orv/all_messages.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/random.hpp"

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

TEST(TextForm, HasThePayloadInItsEnvelope) {
  struct Case {
    std::string_view name;
    std::string_view text;
    std::string_view outcome;
  };
  const Case cases[] = {
      {"nothing", "", ""},
      {"payload as bytes", R"(type: groupMessage data: "\"\000")", "10 05 1A 02 22 00"},
      {"payload as a message", "type: groupMessage data { memberLeft {} }", "10 05 1A 02 22 00"},
      {"type behind the payload", "data { memberLeft {} } type: 5", "10 05 1A 02 22 00"},
      {"payload of no fields", "type: joinRequest data {}", "10 01 1A 00"},
      {"connection response", "type: connectionResponse data { denied {} }", "10 04 1A 02 1A 00"},
      {"enumeration without a name", "type: 9", "10 09"},
      {"no type", "version: 1\ndata { }", "2:1: a message, but no \"type\" says which"},
      {"type without a payload", "type: 9 data { }", "1:9: a message, but no \"type\" says which"},
      {"unknown field of the payload", "type: groupMessage\ndata {\n  memberleft {}\n}",
       "3:14: Message type \"orv.Group\" has no field named \"memberleft\""},
      {"unknown field of the envelope", "type: groupMessage\nversoin: 1\ndata {}",
       "2:8: Message type \"orv.SessionMessage\" has no field named \"versoin\""},
      {"unknown field behind a closed payload", "data: \"\"\n  x: 1",
       "2:4: Message type \"orv.SessionMessage\" has no field named \"x\""},
      {"payload that does not end", "type: groupMessage\ndata {", "2:7: Expected identifier, got: "},
      {"second member of a oneof", "type: groupMessage data { memberLeft {} initialize {} }",
       "1:52: Field \"initialize\" is specified along with field \"memberLeft\", another member of oneof "
       "\"event\""},
      {"field given twice", "version: 1 version: 1",
       "1:19: Non-repeated field \"version\" is specified multiple times"},
      {"ill-formed UTF-8", "type: connectionRequest data {\n  handle: \"a\\377\" }",
       "2:3: ill-formed UTF-8 in handle"},
  };
  for (const Case& each : cases) {
    EXPECT_EQ(outcome(tool::typeOf<SessionMessage>(), each.text), each.outcome) << each.name;
  }
}

TEST(TextForm, TellsOfIllFormedTextsInLists) {
  const tool::MessageType& type = tool::typeOf<JoinResponse::Content::ApprovalContent>();
  EXPECT_EQ(outcome(type, "memberHandles: [\"a\",\n \"\\300\"]"),
            "1:1: ill-formed UTF-8 in memberHandles[1]");
  EXPECT_EQ(outcome(tool::typeOf<Group>(), "initialize { members {}\n members { tokenID: \"\\200\" } }"),
            "2:12: ill-formed UTF-8 in tokenID");
}

TEST(TextForm, RefusesDeepNestingInTime) {
  std::string deep = "type: groupMessage data ";
  for (int level = 0; level < 100'000; ++level) deep += "{ x ";
  EXPECT_NE(outcome(tool::typeOf<SessionMessage>(), deep), "");
  EXPECT_NE(outcome(tool::typeOf<Group>(), deep), "");
}

}  // namespace
}  // namespace orv::test
