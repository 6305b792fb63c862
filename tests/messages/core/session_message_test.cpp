#include <orv/session_message.hpp>

#include <gtest/gtest.h>

#include <limits>

#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

TEST(SessionMessageType, HoldsAnyRawValue) {
  EXPECT_EQ(VessaSessionMessageType(), VessaSessionMessageType::unknown);
  for (const std::int64_t raw :
       {std::int64_t{6}, std::int64_t{-1}, std::numeric_limits<std::int64_t>::min(),
        std::numeric_limits<std::int64_t>::max(), std::int64_t{3} + (std::int64_t{1} << 32)}) {
    const VessaSessionMessageType type(raw);
    EXPECT_EQ(type.rawValue(), raw);
    EXPECT_TRUE(type.isUnrecognized());
    for (const VessaSessionMessageType& named : VessaSessionMessageType::allCases())
      EXPECT_FALSE(type == named);
  }
}

TEST(SessionMessageType, EqualsItsNamedCaseWhenUnrecognized) {
  const auto three = VessaSessionMessageType::UNRECOGNIZED(3);
  EXPECT_EQ(three, VessaSessionMessageType::connectionRequest);
  EXPECT_EQ(three.hashValue(), VessaSessionMessageType::connectionRequest.hashValue());
  SessionMessage left, right;
  left.setType(three);
  right.setType(VessaSessionMessageType::connectionRequest);
  EXPECT_EQ(left, right);
  EXPECT_EQ(left.hashValue(), right.hashValue());
}

TEST(SessionMessageType, TravelsInItsLow32Bits) {
  SessionMessage message;
  message.setType(VessaSessionMessageType::UNRECOGNIZED(-2));
  EXPECT_EQ(toHex(*message.serialize()), "10 FE FF FF FF FF FF FF FF FF 01");
  message.setType(VessaSessionMessageType::UNRECOGNIZED((std::int64_t{1} << 40) + 5));
  EXPECT_EQ(toHex(*message.serialize()), "10 05");
  EXPECT_EQ(message.encodedSize(), 2U);
  message.setType(VessaSessionMessageType::UNRECOGNIZED(std::int64_t{1} << 31));
  EXPECT_EQ(SessionMessage::parse(*message.serialize())->type().rawValue(), -(std::int64_t{1} << 31));
}

TEST(SessionMessage, TellsAbsentFromDefault) {
  SessionMessage message;
  EXPECT_FALSE(message.hasVersion() || message.hasType() || message.hasData());
  EXPECT_TRUE(message.version() == 0 && message.type().rawValue() == 0 && message.data().isEmpty());
  EXPECT_FALSE(message.hasVersion() || message.hasType() || message.hasData());

  message.setVersion(0);
  EXPECT_TRUE(message.hasVersion());
  EXPECT_EQ(toHex(*message.serialize()), "08 00");
  EXPECT_FALSE(message == SessionMessage());
  EXPECT_NE(message.hashValue(), SessionMessage().hashValue());
  message.clearVersion();
  message.setType({});
  EXPECT_EQ(toHex(*message.serialize()), "10 00");
  EXPECT_FALSE(message == SessionMessage());
  message.clearType();
  EXPECT_EQ(message.type(), VessaSessionMessageType::unknown);
  message.setData({});
  EXPECT_EQ(toHex(*message.serialize()), "1A 00");
  EXPECT_FALSE(message == SessionMessage());
  message.clearData();
  EXPECT_EQ(message, SessionMessage());
}

TEST(SessionMessage, BecomesPresentByAChangeInPlace) {
  SessionMessage message;
  ++message.mutableVersion();
  (void)message.mutableType();
  message.mutableData() = message.data() + ByteBuffer("x");
  EXPECT_EQ(toHex(*message.serialize()), "08 01 10 00 1A 01 78");
}

}  // namespace
}  // namespace orv::test
