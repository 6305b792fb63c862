// Messages that are not the protocol's.
#include <gtest/gtest.h>

#include <orv/binary_decoder.hpp>
#include <orv/instantiate.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/nested_messages.hpp"

namespace orv::test {

// As deep as none of the others.
class Shelf final : public Message<Shelf> {
 public:
  static constexpr std::string_view protoMessageName = "test.Shelf";

 private:
  friend Message;
  std::vector<Folder> folders_;
  static constexpr std::tuple fields{field<&Shelf::folders_>(1, "folders")};
};

namespace {

TEST(OwnMessage, IsReadWrittenComparedAndNamedByItsTable) {
  const std::string bytes = hex("0A 02 22 00 12 00 12 02 0A 00 FA 7F 01 61 18 05");
  const Wrapper message = Wrapper::parse(bytes).value();
  EXPECT_EQ(encoded(message), toHex(bytes));
  EXPECT_EQ(message.encodedSize(), bytes.size());
  EXPECT_EQ(
      message.debugDescription(),
      "group {\n  memberLeft {\n  }\n}\ngroups {\n}\ngroups {\n  initialize {\n  }\n}\nname: \"a\"\n3: 5\n");
  Wrapper other;
  ASSERT_TRUE(other.reparse(bytes));
  EXPECT_EQ(other, message);
  EXPECT_EQ(other.hashValue(), message.hashValue());
  EXPECT_EQ(Wrapper::parse(hex("0A 04 22 02 0A 09")).error().message(),
            "test.Wrapper.group.memberLeft.groupUUID: length 9 runs 9 bytes past the end, at byte 5");
  EXPECT_EQ(Wrapper::parse(hex("0A 02 12 00 0A 06 12 00 12 02 0A 09")).error().message(),
            "test.Wrapper.group.memberAdded.groupUUID: length 9 runs 9 bytes past the end, at byte 11");
}

TEST(OwnMessage, ShowsFiveStepsOfAPath) {
  const DecodeError shallow = Shelf::parse(hex("0A 08 12 06 0A 04 0A 02 12 05")).error();
  EXPECT_EQ(shallow.message(),
            "test.Shelf.folders.wrapper.group.initialize.members: "
            "length 5 runs 5 bytes past the end, at byte 9");
  const DecodeError deep = Shelf::parse(hex("0A 0A 12 08 0A 06 0A 04 12 02 0A 05")).error();
  EXPECT_EQ(deep.message(),
            "test.Shelf.folders.wrapper.group.initialize.members.(1 deeper): "
            "length 5 runs 5 bytes past the end, at byte 11");
  EXPECT_NE(deep.path, shallow.path);
  EXPECT_NE(deep, shallow);
  FieldPath unnamed;
  unnamed.assign(Shelf::descriptor(), std::array<std::uint32_t, 2>{5, 1}, 0);
  EXPECT_EQ(unnamed.text(), "test.Shelf.5.1");
}

TEST(OwnMessage, ReadsAPayloadInAMessageThatComesAgainBeforeTheHookIsAsked) {
  const std::string input = hex("0A 02 22 00 0A 04 22 02 0A 09");
  int asked = 0;
  auto counting = [&] { return (++asked, std::expected<void, DecodeError>()); };
  BinaryDecoder decoder(std::as_bytes(std::span(input)), counting);
  Wrapper message;
  EXPECT_EQ(message.decodeMessage(decoder).error().cause, DecodeCause::lengthOverrun);
  EXPECT_EQ(asked, 0);
  EXPECT_EQ(encoded(message), "0A 02 22 00");
}

TEST(OwnMessage, MergesAMessageThatComesAgainInLinearTime) {
  // A thousand members, and then the message that holds them fifty thousand times more.
  std::string members;
  for (int count = 0; count < 1000; ++count) members += record(2, record(1, std::string(50, 'h')));
  std::string input = record(1, record(1, members));
  for (int count = 0; count < 50'000; ++count) input += hex("0A 02 0A 00");
  const HeapMeter meter;
  const Wrapper message = Wrapper::parse(input).value();
  EXPECT_LT(meter.totalBytes(), 2 * input.size());
  EXPECT_EQ(message.encodedSize(), record(1, record(1, members)).size());
}

TEST(OwnMessage, AsksTheHookAboutAOneofInAMessageThatComesAgain) {
  const struct {
    std::string_view input;
    int askedTimes;
    std::string_view whenRefused;
  } cases[] = {
      {"0A 02 22 00 0A 02 0A 00", 1, "0A 02 22 00"},
      {"0A 02 22 00 0A 00 0A 04 22 02 10 01", 1, "0A 02 22 00"},
      {"0A 00 0A 02 0A 00", 0, "0A 02 0A 00"},
      {"12 02 22 00 12 02 0A 00", 0, "12 02 22 00 12 02 0A 00"},  // each element has a oneof of its own
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.input);
    const std::string input = hex(row.input);
    int asked = 0;
    auto counting = [&] { return (++asked, std::expected<void, DecodeError>()); };
    BinaryDecoder accepting(std::as_bytes(std::span(input)), counting);
    Wrapper accepted;
    ASSERT_TRUE(accepted.decodeMessage(accepting));
    EXPECT_EQ(asked, row.askedTimes);

    auto refusing = [] { return std::expected<void, DecodeError>(std::unexpect); };
    BinaryDecoder decoder(std::as_bytes(std::span(input)), refusing);
    Wrapper refused;
    EXPECT_EQ(refused.decodeMessage(decoder).has_value(), row.askedTimes == 0);
    EXPECT_EQ(encoded(refused), toHex(hex(row.whenRefused)));
  }
}

}  // namespace
}  // namespace orv::test

template class orv::Message<orv::test::Shelf>;
