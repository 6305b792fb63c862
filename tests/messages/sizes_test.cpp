// Encodings of 2^31-1 bytes, the most that the format allows, and of one byte more. A program of its own that needs
// 8 GiB.
#include <gtest/gtest.h>

#include <orv/orv.hpp>
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

constexpr std::size_t largest = 0x7FFFFFFF;

// By every way to encode. The encoding begins with `head` and ends with a z.
template <class M>
void expectEncoding(const M& message, std::size_t size, std::string_view head) {
  const bool fits = size <= largest;
  const auto expectOutcome = [&](const auto& result, std::string_view written) {
    ASSERT_EQ(result.has_value(), fits);
    if (!fits) {
      EXPECT_EQ(result.error(), EncodeError::tooLarge);
      return;
    }
    EXPECT_EQ(written.size(), size);
    EXPECT_EQ(toHex(written.substr(0, head.size())), toHex(head));
    EXPECT_EQ(written.back(), 'z');
  };

  EXPECT_EQ(message.encodedSize(), size);
  {
    SCOPED_TRACE("serialize");
    const auto bytes = message.serialize();
    expectOutcome(bytes, fits ? std::string_view(*bytes) : "");
    EXPECT_TRUE(!fits || M::parse(*bytes) == message);
  }
  {
    SCOPED_TRACE("serializeInto");
    std::string room(size, '\0');
    expectOutcome(message.serializeInto(room), room);
    room.resize(largest - 1);
    EXPECT_FALSE(message.serializeInto(room));
  }
  {
    SCOPED_TRACE("BinaryEncoder on a string");
    std::string output = "before";
    BinaryEncoder encoder(output);
    const auto result = message.traverse(encoder);
    encoder.finish();
    expectOutcome(result, std::string_view(output).substr(6));
    EXPECT_EQ(output.substr(0, 6), "before");
    EXPECT_TRUE(fits || output.size() == 6U);
  }
  {
    SCOPED_TRACE("appendDelimited");
    std::string output = "before";
    const auto result = appendDelimited(message, output);
    const std::string before = fits ? "before" + hex("FF FF FF FF 07") : "before";
    EXPECT_EQ(output.substr(0, 11), before);
    expectOutcome(result, std::string_view(output).substr(before.size()));
  }
}

std::string endingInZ(std::size_t size) {
  std::string text(size, 'x');
  text.back() = 'z';
  return text;
}

TEST(Sizes, OneField) {
  for (const std::size_t size : {largest, largest + 1}) {
    SCOPED_TRACE(size);
    SessionMessage message;
    message.setData(ByteBuffer(endingInZ(size - 6)));
    expectEncoding(message, size, hex("1A F9 FF FF FF 07"));
  }
}

// Each message in the message fits; a message around them does not.
TEST(Sizes, ManyFieldsInAMessageInAMessage) {
  constexpr std::size_t half = std::size_t{1} << 30;
  for (const std::size_t size : {largest, largest + 1}) {
    SCOPED_TRACE(size);
    Group group;
    auto& members = group.mutableInitialize().mutableMembers();
    members.resize(2);
    members[0].setHandle(Text(std::string(half, 'x')));
    // Of tags and lengths there are 6 bytes for the payload, and 12 for each member.
    members[1].setHandle(Text(endingInZ(size - 6 - 12 - half - 12)));
    expectEncoding(group, size, hex("0A F9 FF FF FF 07 12 86 80 80 80 04 0A 80 80 80 80 04 78"));
  }
}

// The format's own bound is that of one encoding, not of what it is appended to.
TEST(Sizes, AppendingToLongStrings) {
  SessionMessage message;
  message.setVersion(7);
  std::string output(largest + 1, 'x');
  {
    BinaryEncoder encoder(output);
    ASSERT_TRUE(message.traverse(encoder));
  }
  EXPECT_EQ(toHex(std::string_view(output).substr(largest + 1)), "08 07");
  ASSERT_TRUE(appendDelimited(message, output));
  EXPECT_EQ(toHex(std::string_view(output).substr(largest + 1)), "08 07 02 08 07");
}

TEST(Sizes, LengthsThatOverflow32Bits) {
  constexpr std::size_t size = (std::size_t{1} << 32) + 1;
  SessionMessage message;
  message.setData(ByteBuffer(std::string(size, 'x')));
  EXPECT_GT(message.encodedSize(), size);
  EXPECT_EQ(message.serialize(), std::unexpected(EncodeError::tooLarge));
  std::string output;
  EXPECT_EQ(appendDelimited(message, output), std::unexpected(EncodeError::tooLarge));
  EXPECT_EQ(appendDelimited(message.data().characters(), output), std::unexpected(EncodeError::tooLarge));
  std::byte room[8];
  EXPECT_FALSE(message.serializeInto(room));
  EXPECT_EQ(output, "");
}

}  // namespace
}  // namespace orv::test
