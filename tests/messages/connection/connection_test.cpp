#include <gtest/gtest.h>

#include <orv/connection_request.hpp>
#include <orv/connection_response.hpp>
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

using Content = ConnectionResponse::Content;

TEST(ConnectionRequest, TellsAbsentFromEmpty) {
  ConnectionRequest request;
  request.setIdentifier("");
  EXPECT_EQ(request, ConnectionRequest());
  request.setDisplayName("");
  EXPECT_TRUE(request.hasDisplayName());
  EXPECT_EQ(toHex(*request.serialize()), "1A 00");
  EXPECT_FALSE(request == ConnectionRequest());
  request.clearDisplayName();
  request.setUserInfo({});
  EXPECT_TRUE(request.hasUserInfo() && request.displayName().isEmpty());
  EXPECT_EQ(toHex(*request.serialize()), "22 00");
  EXPECT_FALSE(request == ConnectionRequest());
  request.clearUserInfo();
  EXPECT_EQ(request, ConnectionRequest());
}

TEST(ConnectionRequest, BecomesPresentByAChangeInPlace) {
  ConnectionRequest request;
  (void)request.mutableDisplayName();
  request.mutableUserInfo() = ByteBuffer("\x01");
  request.mutableIdentifier() += "a";
  request.mutableHandle() += "b";
  EXPECT_EQ(toHex(*request.serialize()), "0A 01 61 12 01 62 1A 00 22 01 01");
}

TEST(ConnectionRequest, EqualsOneInAnotherNormalForm) {
  ConnectionRequest composed, decomposed;
  composed.setIdentifier("\u00E9");
  decomposed.setIdentifier("e\u0301");
  EXPECT_EQ(composed, decomposed);
  EXPECT_EQ(composed.hashValue(), decomposed.hashValue());
  EXPECT_EQ(toHex(*composed.serialize()), "0A 02 C3 A9");
  EXPECT_EQ(toHex(*decomposed.serialize()), "0A 03 65 CC 81");
}

TEST(ConnectionResponse, ReadsACaseThatItDoesNotHoldAsDefault) {
  Content content;
  EXPECT_TRUE(content.approved().invitationData().isEmpty());
  EXPECT_FALSE(content.operation());
  content.setDenied({});
  EXPECT_EQ(content.approved(), Content::ApprovalContent());
  EXPECT_TRUE(std::holds_alternative<Content::DeniedContent>(*content.operation()));
  EXPECT_EQ(toHex(*content.serialize()), "1A 00");
}

TEST(ConnectionResponse, SwitchesItsCaseByWriting) {
  Content content;
  content.setDenied({});
  content.mutableApproved().setInvitationData(ByteBuffer("\x01\x02"));
  EXPECT_EQ(toHex(*content.serialize()), "22 04 0A 02 01 02");
  (void)content.mutableApproved();
  EXPECT_EQ(content.approved().invitationData().size(), 2U);
  content.setApproved({});
  EXPECT_EQ(toHex(*content.serialize()), "22 00");
  (void)content.mutableDenied();
  EXPECT_EQ(toHex(*content.serialize()), "1A 00");
  content.setOperation(std::nullopt);
  EXPECT_EQ(content, Content());
}

TEST(ConnectionResponse, ComparesCasesAndPayloads) {
  Content unset, denied, approved, deniedWithMore;
  denied.setDenied({});
  approved.setApproved({});
  deniedWithMore = Content::parse(hex("1A 02 08 01")).value();
  const Content* const all[] = {&unset, &denied, &approved, &deniedWithMore};
  for (const Content* const left : all) {
    for (const Content* const right : all) {
      EXPECT_EQ(*left == *right, left == right);
      EXPECT_EQ(left->operation() == right->operation(), left == right);
      EXPECT_EQ(left->hashValue() == right->hashValue(), left == right);
    }
  }
}

}  // namespace
}  // namespace orv::test
