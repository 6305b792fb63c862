// Which payload goes into which envelope, and what comes out of one.
#include <orv/envelope.hpp>

#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <variant>

#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

struct Case {
  std::string_view name;
  std::string_view envelope;
  std::string_view outcome;
};

// The payload's name and encoding, or else the error's message.
std::string unpacked(std::string_view envelope) {
  const auto payload = envelope::unpack(SessionMessage::parse(hex(envelope)).value());
  if (!payload) return payload.error().message();
  return std::visit(
      []<class M>(const M& message) {
        return std::string(M::protoMessageName) + ' ' + toHex(message.serialize().value());
      },
      *payload);
}

TEST(Envelope, GivesThePayloadThatItsTypeNames) {
  const Case cases[] = {
      {"join request", "10 01 1A 03 0A 01 FF", "orv.JoinRequest 0A 01 FF"},
      {"join response", "10 02 1A 03 12 01 FF", "orv.JoinResponse 12 01 FF"},
      {"connection request", "10 03 1A 03 0A 01 61", "orv.ConnectionRequest 0A 01 61"},
      {"connection response", "10 04 1A 02 1A 00", "orv.ConnectionResponse.Content 1A 00"},
      {"group", "10 05 1A 02 22 00", "orv.Group 22 00"},
      {"empty payload", "08 01 10 05 1A 00", "orv.Group "},
      {"unknown fields around and in it", "10 05 1A 02 48 01 48 02", "orv.Group 48 01"},
      {"the last of several", "1A 01 FF 10 05 1A 02 22 00", "orv.Group 22 00"},
      {"no type", "1A 00", "an envelope of the type unknown carries no payload"},
      {"type without a name", "10 09 1A 00", "an envelope of the type 9 carries no payload"},
      {"no data", "10 05", "an envelope of the type groupMessage without data"},
      {"malformed payload", "10 05 1A 04 12 02 12 05",
       "malformed payload: orv.Group.memberAdded.member: length 5 runs 5 bytes past the end, at byte 3"},
  };
  for (const Case& each : cases) EXPECT_EQ(unpacked(each.envelope), each.outcome) << each.name;
}

// The payload with this encoding in an envelope, put there as bytes and written at once.
template <class M>
void expectPacked(std::string_view payload, std::string_view envelope) {
  SCOPED_TRACE(M::protoMessageName);
  const M message = M::parse(hex(payload)).value();
  const auto packed = envelope::pack(message);
  ASSERT_TRUE(packed.has_value());
  EXPECT_EQ(toHex(packed->serialize().value()), envelope);
  const envelope::Envelope<M> open(message);
  EXPECT_EQ(toHex(open.serialize().value()), envelope);
  EXPECT_EQ(envelope::Envelope<M>::parse(hex(envelope)).value(), open);
}

TEST(Envelope, TakesEachPayloadUnderItsType) {
  expectPacked<JoinRequest>("0A 01 FF", "10 01 1A 03 0A 01 FF");
  expectPacked<JoinResponse>("12 01 FF", "10 02 1A 03 12 01 FF");
  expectPacked<ConnectionRequest>("0A 01 61", "10 03 1A 03 0A 01 61");
  expectPacked<ConnectionResponse::Content>("1A 00", "10 04 1A 02 1A 00");
  expectPacked<Group>("22 00", "10 05 1A 02 22 00");
  expectPacked<Group>("", "10 05 1A 00");
}

TEST(Envelope, KeepsWhatStandsBesideAPayload) {
  const auto closed = SessionMessage::parse(hex("08 07 10 09 1A 01 FF 48 02")).value();
  envelope::Envelope<Group> open(closed, Group());
  EXPECT_EQ(toHex(open.serialize().value()), "08 07 10 09 1A 00 48 02");
  open.setVersion(1);
  EXPECT_EQ(open.debugDescription(), "version: 1\ntype: 9\ndata {\n}\n9: 2\n");
}

TEST(Envelope, CarriesNoMessageThatIsNotPaired) {
  static_assert(!envelope::Carried<Member> && !envelope::Carried<ConnectionResponse>);
  static_assert(envelope::payloadOf(VessaSessionMessageType::groupMessage) == &Group::descriptor());
  static_assert(envelope::payloadOf(VessaSessionMessageType::unknown) == nullptr);
}

}  // namespace
}  // namespace orv::test
