#include <orv/wire_reader.hpp>

#include <gtest/gtest.h>

#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

TEST(WireReader, LeavesItsPositionWhereWhatItCannotReadBegins) {
  const std::string bytes = hex("08 80");
  WireReader reader(std::as_bytes(std::span(bytes)));
  EXPECT_EQ(reader.readTag().value().value, 8U);
  EXPECT_EQ(reader.readVarint().error().cause, DecodeCause::truncated);
  EXPECT_EQ(reader.remaining(), 1U);
  EXPECT_EQ(reader.readTag().error().cause, DecodeCause::truncated);
  EXPECT_EQ(reader.readLengthDelimited().error().cause, DecodeCause::truncated);
  EXPECT_EQ(reader.readFixed32().error().cause, DecodeCause::truncated);
  EXPECT_EQ(reader.readFixed64().error().cause, DecodeCause::truncated);
  EXPECT_EQ(reader.remaining(), 1U);
  EXPECT_EQ(WireReader().readTag().error().cause, DecodeCause::truncated);
}

TEST(WireReader, ReadsNumbersOfEveryLength) {
  for (int bits = 0; bits <= 64; ++bits) {
    const std::uint64_t value = bits == 0 ? 0 : ~std::uint64_t{0} >> (64 - bits);
    const std::string bytes = varint(value);
    WireReader reader(std::as_bytes(std::span(bytes)));
    EXPECT_EQ(reader.readVarint().value(), value);
    EXPECT_TRUE(reader.isAtEnd());
  }
  const std::string bytes = hex("01 02 03 84 05 06 07 08 09 0A 0B 8C");
  WireReader reader(std::as_bytes(std::span(bytes)));
  EXPECT_EQ(reader.readFixed32().value(), 0x84030201U);
  EXPECT_EQ(reader.readFixed64().value(), 0x8C0B0A0908070605U);
}

}  // namespace
}  // namespace orv::test
