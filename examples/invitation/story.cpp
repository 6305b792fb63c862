#include "examples/invitation/story.hpp"

#include <array>
#include <cstddef>

namespace invitation::story {

namespace {

constexpr std::string_view sessionIdentifier = "movie-night";
constexpr std::string_view speaker = "speaker@kitchen";

orv::ByteBuffer groupUuid() {
  return orv::ByteBuffer("\x3B\x1F\x54\xC0\x9A\x77\x4E\x0D\x8C\x21\x5E\xB6\xD4\x90\x13\xFA");
}

orv::Member memberOf(const Person& person) {
  orv::Member member;
  member.setHandle(person.handle);
  return member;
}

orv::Member memberWithToken() {
  orv::Member member;
  member.setHandle(speaker);
  member.setTokenID("token-1");
  return member;
}

orv::ConnectionResponse::Content answerTo(const Person& guest) {
  orv::ConnectionResponse::Content answer;
  answer.setIdentifier(guest.identifier);
  answer.setHandle(host.handle);
  return answer;
}

}  // namespace

orv::ConnectionRequest connectionRequest(const Person& guest) {
  orv::ConnectionRequest request;
  request.setIdentifier(guest.identifier);
  request.setHandle(guest.handle);
  request.setDisplayName(guest.displayName);
  return request;
}

orv::ConnectionResponse::Content connectionApproval(const Person& guest, orv::ByteBuffer hostKey) {
  auto answer = answerTo(guest);
  answer.mutableApproved().setInvitationData(std::move(hostKey));
  return answer;
}

orv::ConnectionResponse::Content connectionDenial(const Person& guest) {
  auto answer = answerTo(guest);
  answer.setDenied({});
  return answer;
}

orv::JoinRequest::Content joinRequest(const Person& guest) {
  orv::JoinRequest::Content body;
  body.setIdentifier(guest.identifier);
  body.setDisplayName(guest.displayName);
  body.setWantsTokenUri(true);
  return body;
}

orv::JoinResponse::Content joinApproval(const Person& guest) {
  orv::JoinResponse::Content body;
  body.setIdentifier(guest.identifier);
  auto& approved = body.mutableApproved();
  approved.setSessionIdentifier(sessionIdentifier);
  approved.setMemberHandles({host.handle, guest.handle});
  return body;
}

std::vector<orv::Group> membershipEvents(const Person& guest) {
  std::vector<orv::Group> events(3);
  auto& initialize = events[0].mutableInitialize();
  initialize.setGroupUuid(groupUuid());
  initialize.setMembers({memberOf(host), memberOf(guest)});
  auto& added = events[1].mutableMemberAdded();
  added.setGroupUuid(groupUuid());
  added.setMember(memberWithToken());
  auto& removed = events[2].mutableMemberRemoved();
  removed.setGroupUuid(groupUuid());
  removed.setMember(memberWithToken());
  return events;
}

orv::Group farewell() {
  orv::Group group;
  auto& left = group.mutableMemberLeft();
  left.setGroupUuid(groupUuid());
  left.setUsesToken(false);
  return group;
}

}  // namespace invitation::story
