#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <variant>

#include "bench/peers/equal_work.hpp"
#include "bench/workloads/plain.hpp"

namespace bench {

// What the code that protoc generates does alike in all its variants. `Messages` lists the types of every
// Kind.
template <class... Messages>
struct OfficialCode : EqualWork {
  template <Kind kind>
  using Value = std::tuple_element_t<static_cast<std::size_t>(kind), std::tuple<Messages...>>;

  static bool decode(auto& value, std::string_view bytes) {
    return value.ParseFromArray(bytes.data(), static_cast<int>(bytes.size()));
  }
  static bool decodeAgain(auto& value, std::string_view bytes) { return decode(value, bytes); }
  static std::string encode(const auto& value) { return value.SerializeAsString(); }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    value.SerializeToArray(buffer.data(), static_cast<int>(buffer.size()));
    return static_cast<std::size_t>(value.GetCachedSize());
  }

  static void build(Value<Kind::sessionMessage>& message, const plain::SessionMessage& source) {
    if (source.version) message.set_version(*source.version);
    if (source.type) message.set_type(static_cast<decltype(message.type())>(*source.type));
    if (source.data) message.set_data(*source.data);
  }
  static void build(Value<Kind::connectionRequest>& message, const plain::ConnectionRequest& source) {
    message.set_identifier(source.identifier);
    message.set_handle(source.handle);
    if (source.displayName) message.set_displayname(*source.displayName);
    if (source.userInfo) message.set_userinfo(*source.userInfo);
  }
  static void build(Value<Kind::connectionResponseContent>& message,
                    const plain::ConnectionResponseContent& source) {
    message.set_identifier(source.identifier);
    message.set_handle(source.handle);
    if (const auto* approval = std::get_if<plain::ConnectionApproval>(&source.operation))
      message.mutable_approved()->set_invitationdata(approval->invitationData);
  }
  static void build(Value<Kind::joinRequest>& message, const plain::JoinRequest& source) {
    if (source.publicKey) message.set_publickey(*source.publicKey);
    if (source.encryptedData) message.set_encrypteddata(*source.encryptedData);
  }
  static void build(Value<Kind::joinRequestContent>& message, const plain::JoinRequestContent& source) {
    message.set_identifier(source.identifier);
    if (source.displayName) message.set_displayname(*source.displayName);
    if (source.userInfo) message.set_userinfo(*source.userInfo);
    if (source.wantsTokenURI) message.set_wantstokenuri(*source.wantsTokenURI);
  }
  static void build(Value<Kind::joinResponseContent>& message, const plain::JoinResponseContent& source) {
    message.set_identifier(source.identifier);
    if (const auto* approval = std::get_if<plain::JoinApproval>(&source.operation)) {
      auto& approved = *message.mutable_approved();
      approved.set_sessionidentifier(approval->sessionIdentifier);
      approved.mutable_memberhandles()->Reserve(static_cast<int>(approval->memberHandles.size()));
      for (const plain::Text& handle : approval->memberHandles) approved.add_memberhandles(handle);
      if (approval->userInfo) approved.set_userinfo(*approval->userInfo);
    }
  }
  static void build(Value<Kind::group>& message, const plain::Group& source) {
    if (const auto* initialization = std::get_if<plain::Initialization>(&source.event)) {
      auto& event = *message.mutable_initialize();
      event.set_groupuuid(initialization->groupUUID);
      event.mutable_members()->Reserve(static_cast<int>(initialization->members.size()));
      for (const plain::Member& member : initialization->members) buildMember(*event.add_members(), member);
    } else if (const auto* added = std::get_if<plain::MemberAdded>(&source.event)) {
      buildChange(*message.mutable_memberadded(), *added);
    } else if (const auto* removed = std::get_if<plain::MemberRemoved>(&source.event)) {
      buildChange(*message.mutable_memberremoved(), *removed);
    } else if (const auto* left = std::get_if<plain::MemberLeft>(&source.event)) {
      message.mutable_memberleft()->set_groupuuid(left->groupUUID);
      message.mutable_memberleft()->set_usestoken(left->usesToken);
    }
  }

  static std::size_t weigh(const Value<Kind::sessionMessage>& message) {
    return message.version() + static_cast<std::size_t>(message.type()) + bench::weigh(message.data());
  }
  static std::size_t weigh(const Value<Kind::connectionRequest>& message) {
    return bench::weigh(message.identifier()) + bench::weigh(message.handle()) +
           bench::weigh(message.displayname()) + bench::weigh(message.userinfo());
  }
  static std::size_t weigh(const Value<Kind::connectionResponseContent>& message) {
    return bench::weigh(message.identifier()) + bench::weigh(message.handle()) +
           bench::weigh(message.approved().invitationdata());
  }
  static std::size_t weigh(const Value<Kind::joinRequest>& message) {
    return bench::weigh(message.publickey()) + bench::weigh(message.encrypteddata());
  }
  static std::size_t weigh(const Value<Kind::joinRequestContent>& message) {
    return bench::weigh(message.identifier()) + bench::weigh(message.displayname()) +
           bench::weigh(message.userinfo()) + message.wantstokenuri();
  }
  static std::size_t weigh(const Value<Kind::joinResponseContent>& message) {
    const auto& approved = message.approved();
    std::size_t sum = bench::weigh(message.identifier()) + bench::weigh(approved.sessionidentifier()) +
                      bench::weigh(approved.userinfo());
    for (const std::string& handle : approved.memberhandles()) sum += bench::weigh(handle);
    return sum;
  }
  static std::size_t weigh(const Value<Kind::group>& message) {
    using Group = Value<Kind::group>;
    std::size_t sum = 0;
    switch (message.event_case()) {
      case Group::kInitialize:
        for (const auto& member : message.initialize().members()) sum += weighMember(member);
        return sum + bench::weigh(message.initialize().groupuuid());
      case Group::kMemberAdded: return weighChange(message.memberadded());
      case Group::kMemberRemoved: return weighChange(message.memberremoved());
      case Group::kMemberLeft:
        return bench::weigh(message.memberleft().groupuuid()) + message.memberleft().usestoken();
      case Group::EVENT_NOT_SET: break;
    }
    return sum;
  }

 private:
  static void buildMember(auto& message, const plain::Member& source) {
    message.set_handle(source.handle);
    if (source.tokenID) message.set_tokenid(*source.tokenID);
  }
  static void buildChange(auto& message, const auto& source) {
    message.set_groupuuid(source.groupUUID);
    if (source.member) buildMember(*message.mutable_member(), *source.member);
  }
  static std::size_t weighMember(const auto& member) {
    return bench::weigh(member.handle()) + bench::weigh(member.tokenid());
  }
  static std::size_t weighChange(const auto& change) {
    return bench::weigh(change.groupuuid()) + weighMember(change.member());
  }
};

}  // namespace bench
