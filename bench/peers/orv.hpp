#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include <orv/all_messages.hpp>
#include "bench/peers/equal_work.hpp"
#include "bench/workloads/plain.hpp"

namespace bench {

// Our own library.
struct Orv : EqualWork {
  static constexpr std::string_view name = "orv";
  static constexpr bool equatesNormalForms = true;

  template <Kind kind>
  using Value = std::tuple_element_t<
      static_cast<std::size_t>(kind),
      std::tuple<orv::SessionMessage, orv::ConnectionRequest, orv::ConnectionResponse::Content,
                 orv::JoinRequest, orv::JoinRequest::Content, orv::JoinResponse::Content, orv::Group>>;

  template <class Message>
  static auto parse(std::string_view bytes) {
    return Message::parse(bytes);
  }
  static bool decode(auto& value, std::string_view bytes) { return value.merge(bytes).has_value(); }
  static bool decodeAgain(auto& value, std::string_view bytes) { return value.reparse(bytes).has_value(); }
  static std::string encode(const auto& value) { return *value.serialize(); }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    return *value.serializeInto(std::as_writable_bytes(buffer));
  }
  static bool equal(const auto& left, const auto& right) { return left == right; }
  static std::uint64_t hash(const auto& value) { return value.hashValue(); }
  static std::string text(const auto& value) { return value.debugDescription(); }

  static void build(orv::SessionMessage& message, const plain::SessionMessage& source) {
    if (source.version) message.setVersion(*source.version);
    if (source.type) message.setType(orv::VessaSessionMessageType(*source.type));
    if (source.data) message.setData(bytes(*source.data));
  }
  static void build(orv::ConnectionRequest& message, const plain::ConnectionRequest& source) {
    message.setIdentifier(text(source.identifier));
    message.setHandle(text(source.handle));
    if (source.displayName) message.setDisplayName(text(*source.displayName));
    if (source.userInfo) message.setUserInfo(bytes(*source.userInfo));
  }
  static void build(orv::ConnectionResponse::Content& message,
                    const plain::ConnectionResponseContent& source) {
    message.setIdentifier(text(source.identifier));
    message.setHandle(text(source.handle));
    if (const auto* approval = std::get_if<plain::ConnectionApproval>(&source.operation)) {
      orv::ConnectionResponse::Content::ApprovalContent approved;
      approved.setInvitationData(bytes(approval->invitationData));
      message.setApproved(std::move(approved));
    }
  }
  static void build(orv::JoinRequest& message, const plain::JoinRequest& source) {
    if (source.publicKey) message.setPublicKey(bytes(*source.publicKey));
    if (source.encryptedData) message.setEncryptedData(bytes(*source.encryptedData));
  }
  static void build(orv::JoinRequest::Content& message, const plain::JoinRequestContent& source) {
    message.setIdentifier(text(source.identifier));
    if (source.displayName) message.setDisplayName(text(*source.displayName));
    if (source.userInfo) message.setUserInfo(bytes(*source.userInfo));
    if (source.wantsTokenURI) message.setWantsTokenUri(*source.wantsTokenURI);
  }
  static void build(orv::JoinResponse::Content& message, const plain::JoinResponseContent& source) {
    message.setIdentifier(text(source.identifier));
    if (const auto* approval = std::get_if<plain::JoinApproval>(&source.operation)) {
      orv::JoinResponse::Content::ApprovalContent approved;
      approved.setSessionIdentifier(text(approval->sessionIdentifier));
      std::vector<orv::Text> handles;
      handles.reserve(approval->memberHandles.size());
      for (const plain::Text& handle : approval->memberHandles) handles.push_back(text(handle));
      approved.setMemberHandles(std::move(handles));
      if (approval->userInfo) approved.setUserInfo(bytes(*approval->userInfo));
      message.setApproved(std::move(approved));
    }
  }
  static void build(orv::Member& message, const plain::Member& source) {
    message.setHandle(text(source.handle));
    if (source.tokenID) message.setTokenID(text(*source.tokenID));
  }
  static void build(orv::Group& message, const plain::Group& source) {
    if (const auto* initialization = std::get_if<plain::Initialization>(&source.event)) {
      orv::Group::Initialization event;
      event.setGroupUuid(bytes(initialization->groupUUID));
      std::vector<orv::Member> members(initialization->members.size());
      for (std::size_t i = 0; i < members.size(); ++i) build(members[i], initialization->members[i]);
      event.setMembers(std::move(members));
      message.setInitialize(std::move(event));
    } else if (const auto* added = std::get_if<plain::MemberAdded>(&source.event)) {
      message.setMemberAdded(change<orv::Group::MemberAdded>(*added));
    } else if (const auto* removed = std::get_if<plain::MemberRemoved>(&source.event)) {
      message.setMemberRemoved(change<orv::Group::MemberRemoved>(*removed));
    } else if (const auto* left = std::get_if<plain::MemberLeft>(&source.event)) {
      orv::Group::MemberLeft event;
      event.setGroupUuid(bytes(left->groupUUID));
      event.setUsesToken(left->usesToken);
      message.setMemberLeft(std::move(event));
    }
  }

  static std::size_t weigh(const orv::SessionMessage& message) {
    return message.version() + static_cast<std::size_t>(message.type().rawValue()) + weigh(message.data());
  }
  static std::size_t weigh(const orv::ConnectionRequest& message) {
    return weigh(message.identifier()) + weigh(message.handle()) + weigh(message.displayName()) +
           weigh(message.userInfo());
  }
  static std::size_t weigh(const orv::ConnectionResponse::Content& message) {
    return weigh(message.identifier()) + weigh(message.handle()) + weigh(message.approved().invitationData());
  }
  static std::size_t weigh(const orv::JoinRequest& message) {
    return weigh(message.publicKey()) + weigh(message.encryptedData());
  }
  static std::size_t weigh(const orv::JoinRequest::Content& message) {
    return weigh(message.identifier()) + weigh(message.displayName()) + weigh(message.userInfo()) +
           message.wantsTokenUri();
  }
  static std::size_t weigh(const orv::JoinResponse::Content& message) {
    const auto& approved = message.approved();
    std::size_t sum =
        weigh(message.identifier()) + weigh(approved.sessionIdentifier()) + weigh(approved.userInfo());
    for (const orv::Text& handle : approved.memberHandles()) sum += weigh(handle);
    return sum;
  }
  static std::size_t weigh(const orv::Group& message) {
    if (!message.event()) return 0;
    return std::visit([](const auto& event) { return weigh(event.groupUuid()) + weighEvent(event); },
                      *message.event());
  }

 private:
  static orv::Text text(const plain::Text& source) { return std::string_view(source); }
  static orv::ByteBuffer bytes(const plain::Bytes& source) {
    return orv::ByteBuffer(std::string_view(source));
  }
  static std::size_t weigh(const orv::Text& text) { return bench::weigh(text.utf8()); }
  static std::size_t weigh(const orv::ByteBuffer& bytes) { return bench::weigh(bytes.characters()); }

  template <class Event>
  static Event change(const auto& source) {
    Event event;
    event.setGroupUuid(bytes(source.groupUUID));
    if (source.member) {
      orv::Member member;
      build(member, *source.member);
      event.setMember(std::move(member));
    }
    return event;
  }

  static std::size_t weighMember(const orv::Member& member) {
    return weigh(member.handle()) + weigh(member.tokenID());
  }
  static std::size_t weighEvent(const orv::Group::Initialization& event) {
    std::size_t sum = 0;
    for (const orv::Member& member : event.members()) sum += weighMember(member);
    return sum;
  }
  static std::size_t weighEvent(const orv::Group::MemberLeft& event) { return event.usesToken(); }
  static std::size_t weighEvent(const auto& change) { return weighMember(change.member()); }
};

}  // namespace bench
