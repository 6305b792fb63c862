#include <gtest/gtest.h>

#include <orv/join_request.hpp>
#include <orv/join_response.hpp>
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

TEST(JoinRequest, TellsAbsentFromEmpty) {
  JoinRequest request;
  request.setEncryptedData({});
  EXPECT_TRUE(request.hasEncryptedData() && !request.hasPublicKey() && request.publicKey().isEmpty());
  EXPECT_EQ(toHex(*request.serialize()), "12 00");
  EXPECT_FALSE(request == JoinRequest());
  request.clearEncryptedData();
  EXPECT_EQ(request, JoinRequest());
  (void)request.mutablePublicKey();
  EXPECT_EQ(toHex(*request.serialize()), "0A 00");
  request.clearPublicKey();
  (void)request.mutableEncryptedData();
  EXPECT_EQ(toHex(*request.serialize()), "12 00");
}

TEST(JoinRequest, KeepsThreeStatesOfItsFlag) {
  JoinRequest::Content absent, no, yes;
  no.setWantsTokenUri(false);
  yes.mutableWantsTokenUri() = true;
  EXPECT_TRUE(!absent.hasWantsTokenUri() && no.hasWantsTokenUri() && yes.hasWantsTokenUri());
  EXPECT_TRUE(!absent.wantsTokenUri() && !no.wantsTokenUri() && yes.wantsTokenUri());
  EXPECT_FALSE(absent == no || no == yes || absent == yes);
  EXPECT_EQ(toHex(*no.serialize()), "28 00");
  no.clearWantsTokenUri();
  EXPECT_EQ(no, absent);
}

TEST(JoinRequest, ContentSetsEachOfItsFields) {
  JoinRequest::Content content;
  content.setIdentifier("i");
  content.setDisplayName("d");
  content.setUserInfo(ByteBuffer("u"));
  EXPECT_EQ(toHex(*content.serialize()), "0A 01 69 1A 01 64 22 01 75");
  content.mutableIdentifier() += "j";
  content.clearDisplayName();
  content.clearUserInfo();
  EXPECT_FALSE(content.hasDisplayName() || content.hasUserInfo());
  (void)content.mutableDisplayName();
  (void)content.mutableUserInfo();
  EXPECT_EQ(toHex(*content.serialize()), "0A 02 69 6A 1A 00 22 00");
}

TEST(JoinResponse, TellsAbsentFromEmpty) {
  JoinResponse response;
  (void)response.mutableEncryptedData();
  EXPECT_TRUE(response.hasEncryptedData());
  EXPECT_EQ(toHex(*response.serialize()), "12 00");
  response.clearEncryptedData();
  EXPECT_EQ(response, JoinResponse());

  JoinResponse::Content::ApprovalContent approval;
  (void)approval.mutableUserInfo();
  EXPECT_EQ(toHex(*approval.serialize()), "1A 00");
  EXPECT_FALSE(approval == JoinResponse::Content::ApprovalContent());
  approval.clearUserInfo();
  EXPECT_EQ(approval, JoinResponse::Content::ApprovalContent());
}

TEST(JoinResponse, SwitchesItsCaseByWriting) {
  JoinResponse::Content content;
  content.setIdentifier("a");
  content.setDenied({});
  EXPECT_EQ(content.approved(), JoinResponse::Content::ApprovalContent());
  EXPECT_EQ(toHex(*content.serialize()), "0A 01 61 1A 00");
  content.mutableApproved().setSessionIdentifier("s");
  EXPECT_EQ(toHex(*content.serialize()), "0A 01 61 22 03 0A 01 73");
  content.mutableApproved().mutableMemberHandles().emplace_back("b");
  EXPECT_EQ(content.approved().sessionIdentifier(), Text("s"));
  content.mutableDenied();
  content.setOperation(std::nullopt);
  EXPECT_EQ(toHex(*content.serialize()), "0A 01 61");
}

TEST(JoinResponse, ComparesHandlesInOrder) {
  JoinResponse::Content::ApprovalContent left, right;
  left.setMemberHandles({"b", "\u00E9"});
  right.setMemberHandles({"b", "e\u0301"});
  EXPECT_EQ(left, right);
  EXPECT_EQ(left.hashValue(), right.hashValue());
  right.setMemberHandles({"\u00E9", "b"});
  EXPECT_FALSE(left == right);
  right.setMemberHandles({"b"});
  EXPECT_FALSE(left == right);
}

}  // namespace
}  // namespace orv::test
