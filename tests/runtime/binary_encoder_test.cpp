#include <orv/binary_encoder.hpp>

#include <gtest/gtest.h>
#include <sys/mman.h>

#include <orv/group.hpp>
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

TEST(BinaryEncoder, AppendsToAString) {
  Group group;
  group.mutableMemberAdded().setGroupUuid(ByteBuffer(std::string(300, 'u')));
  std::string output = "before";
  BinaryEncoder encoder(output);
  ASSERT_TRUE(group.traverse(encoder));
  const std::size_t written = encoder.finish();
  EXPECT_EQ(output.size(), 6 + written);
  EXPECT_EQ(toHex(output), toHex("before" + record(2, record(1, std::string(300, 'u')))));
}

TEST(BinaryEncoder, WritesTagsAndLengthsOfEverySize) {
  const ByteBuffer bytes{std::string(200, 'b')};
  for (const std::uint32_t number : {1U, 15U, 16U, 2047U, 2048U, 536870911U}) {
    std::string output;
    BinaryEncoder encoder(output);
    ASSERT_TRUE(encoder.visitSingularBytesField(bytes, number));
    ASSERT_TRUE(encoder.visitSingularBytesField(ByteBuffer("b"), number));
    ASSERT_TRUE(encoder.visitSingularUInt32Field(128, number));
    ASSERT_TRUE(encoder.visitSingularMessageField(Group(), number));
    encoder.finish();
    EXPECT_EQ(toHex(output), toHex(record(number, std::string(200, 'b')) + record(number, "b") +
                                   varint(number << 3) + hex("80 01") + record(number, "")));
  }
}

TEST(BinaryEncoder, SaysThatABufferIsTooSmall) {
  const Group group = Group::parse(hex("0A 02 12 00")).value();
  std::array<std::byte, 3> room;
  BinaryEncoder walked(room);
  EXPECT_EQ(group.traverse(walked), std::unexpected(EncodeError::bufferTooSmall));
  BinaryEncoder visited(room);
  EXPECT_FALSE(visited.visitSingularMessageField(group, 1));
  EXPECT_EQ(visited.error(), EncodeError::bufferTooSmall);
}

TEST(BinaryEncoder, RefusesMoreThanTheFormatAllows) {
#ifdef __SANITIZE_THREAD__
  GTEST_SKIP() << "the thread sanitizer would take ten gigabytes to watch two";
#endif
  // Room for more, of which no page outlives the writing to it.
  constexpr std::size_t roomSize = (std::size_t{1} << 31) + (std::size_t{1} << 28);
  void* const room =
      mmap(nullptr, roomSize, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
  ASSERT_NE(room, MAP_FAILED);
  BinaryEncoder encoder(std::span(static_cast<std::byte*>(room), roomSize));
  constexpr std::size_t pieceSize = std::size_t{1} << 27;
  constexpr std::size_t headSize = 5;  // a tag of one byte, a length of four
  const ByteBuffer piece{std::string(pieceSize, 'x')};
  for (int count = 0; count < 15; ++count) {
    ASSERT_TRUE(encoder.visitSingularBytesField(piece, 1));
    madvise(room, roomSize, MADV_DONTNEED);
  }
  EXPECT_FALSE(encoder.visitSingularBytesField(piece, 1));
  EXPECT_EQ(encoder.error(), EncodeError::tooLarge);

  // Up to the last byte it can be filled.
  constexpr std::size_t largest = (std::size_t{1} << 31) - 1;
  const std::size_t left = largest - 15 * (headSize + pieceSize);
  const ByteBuffer last{std::string(left - headSize - 2, 'x')};
  ASSERT_TRUE(encoder.visitSingularBytesField(last, 1));
  EXPECT_FALSE(encoder.visitSingularUInt32Field(128, 1));
  EXPECT_EQ(encoder.error(), EncodeError::tooLarge);
  ASSERT_TRUE(encoder.visitSingularBoolField(true, 1));
  EXPECT_FALSE(encoder.visitSingularBoolField(true, 1));
  EXPECT_EQ(encoder.error(), EncodeError::tooLarge);
  EXPECT_EQ(encoder.finish(), largest);
  munmap(room, roomSize);
}

}  // namespace
}  // namespace orv::test
