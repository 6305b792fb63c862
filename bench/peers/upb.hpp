#pragma once

#include <cstddef>
#include <cstring>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <variant>

#include <orv.upb.h>
#include <upb/mem/arena.h>
#include <upb/message/compare.h>
#include <upb/message/copy.h>
#include <upb/wire/decode.h>
#include <upb/wire/encode.h>

#include "bench/peers/equal_work.hpp"
#include "bench/workloads/plain.hpp"

namespace bench {

// An arena whose first block is part of it.
template <std::size_t blockSize = 4096>
class UpbArena {
 public:
  UpbArena() { begin(); }
  UpbArena(const UpbArena&) = delete;
  UpbArena& operator=(const UpbArena&) = delete;
  ~UpbArena() { upb_Arena_Free(arena_); }

  void reset() {
    upb_Arena_Free(arena_);
    begin();
  }
  upb_Arena* get() const { return arena_; }

 private:
  void begin() { arena_ = upb_Arena_Init(block_, sizeof block_, &upb_alloc_global); }

  alignas(16) char block_[blockSize];
  upb_Arena* arena_;
};

// A message on an arena of its own.
template <class Message, const upb_MiniTable* descriptionOfMessage, std::size_t blockSize = 4096>
class UpbMessage {
 public:
  static constexpr const upb_MiniTable* description = descriptionOfMessage;
  template <std::size_t size>
  using Sized = UpbMessage<Message, descriptionOfMessage, size>;

  UpbMessage() : message_(upb_Message_New(description, arena())) {}
  UpbMessage(const UpbMessage& other) : message_(upb_Message_DeepClone(other.base(), description, arena())) {}
  template <std::size_t otherSize>
  explicit UpbMessage(const UpbMessage<Message, description, otherSize>& other)
      : message_(upb_Message_DeepClone(other.base(), description, arena())) {}

  void reset() {
    arena_.reset();
    message_ = upb_Message_New(description, arena());
  }
  upb_Arena* arena() const { return arena_.get(); }
  upb_Message* base() { return message_; }
  const upb_Message* base() const { return message_; }
  Message* operator*() { return reinterpret_cast<Message*>(message_); }
  const Message* operator*() const { return reinterpret_cast<const Message*>(message_); }

 private:
  UpbArena<blockSize> arena_;
  upb_Message* message_;
};

// upb with its fast tables. Contents are copied from the input into the arena: the value owns what it holds.
struct Upb : EqualWork {
  static constexpr std::string_view name = "upb";

  template <Kind kind>
  using Value = std::tuple_element_t<
      static_cast<std::size_t>(kind),
      std::tuple<UpbMessage<orv_SessionMessage, &orv__SessionMessage_msg_init>,
                 UpbMessage<orv_ConnectionRequest, &orv__ConnectionRequest_msg_init>,
                 UpbMessage<orv_ConnectionResponse_Content, &orv__ConnectionResponse__Content_msg_init>,
                 UpbMessage<orv_JoinRequest, &orv__JoinRequest_msg_init>,
                 UpbMessage<orv_JoinRequest_Content, &orv__JoinRequest__Content_msg_init>,
                 UpbMessage<orv_JoinResponse_Content, &orv__JoinResponse__Content_msg_init>,
                 UpbMessage<orv_Group, &orv__Group_msg_init>>>;
  // Where thousands are held at once: 4 KiB of each would fill the caches with next to nothing.
  template <Kind kind>
  using OneOfMany = typename Value<kind>::template Sized<256>;

  static bool decode(auto& value, std::string_view bytes) {
    return upb_Decode(bytes.data(), bytes.size(), value.base(), value.description, nullptr, 0,
                      value.arena()) == kUpb_DecodeStatus_Ok;
  }
  static bool decodeAgain(auto& value, std::string_view bytes) {
    value.reset();
    return decode(value, bytes);
  }
  // upb encodes onto an arena only; whoever wants the bytes elsewhere copies them.
  static std::string encode(const auto& value) {
    const UpbArena<> arena;
    return std::string(encoded(value, arena));
  }
  static std::size_t encodeInto(const auto& value, std::span<char> buffer) {
    const UpbArena<> arena;
    const std::string_view bytes = encoded(value, arena);
    std::memcpy(buffer.data(), bytes.data(), bytes.size());
    return bytes.size();
  }
  static bool equal(const auto& left, const auto& right) {
    return upb_Message_IsEqual(left.base(), right.base(), left.description,
                               kUpb_CompareOption_IncludeUnknownFields);
  }

  static void build(Value<Kind::sessionMessage>& value, const plain::SessionMessage& source) {
    if (source.version) orv_SessionMessage_set_version(*value, *source.version);
    if (source.type) orv_SessionMessage_set_type(*value, *source.type);
    if (source.data) orv_SessionMessage_set_data(*value, copied(value, *source.data));
  }
  static void build(Value<Kind::connectionRequest>& value, const plain::ConnectionRequest& source) {
    orv_ConnectionRequest_set_identifier(*value, copied(value, source.identifier));
    orv_ConnectionRequest_set_handle(*value, copied(value, source.handle));
    if (source.displayName) orv_ConnectionRequest_set_displayName(*value, copied(value, *source.displayName));
    if (source.userInfo) orv_ConnectionRequest_set_userInfo(*value, copied(value, *source.userInfo));
  }
  static void build(Value<Kind::connectionResponseContent>& value,
                    const plain::ConnectionResponseContent& source) {
    orv_ConnectionResponse_Content_set_identifier(*value, copied(value, source.identifier));
    orv_ConnectionResponse_Content_set_handle(*value, copied(value, source.handle));
    if (const auto* approval = std::get_if<plain::ConnectionApproval>(&source.operation)) {
      orv_ConnectionResponse_Content_ApprovalContent_set_invitationData(
          orv_ConnectionResponse_Content_mutable_approved(*value, value.arena()),
          copied(value, approval->invitationData));
    }
  }
  static void build(Value<Kind::joinRequest>& value, const plain::JoinRequest& source) {
    if (source.publicKey) orv_JoinRequest_set_publicKey(*value, copied(value, *source.publicKey));
    if (source.encryptedData) orv_JoinRequest_set_encryptedData(*value, copied(value, *source.encryptedData));
  }
  static void build(Value<Kind::joinRequestContent>& value, const plain::JoinRequestContent& source) {
    orv_JoinRequest_Content_set_identifier(*value, copied(value, source.identifier));
    if (source.displayName)
      orv_JoinRequest_Content_set_displayName(*value, copied(value, *source.displayName));
    if (source.userInfo) orv_JoinRequest_Content_set_userInfo(*value, copied(value, *source.userInfo));
    if (source.wantsTokenURI) orv_JoinRequest_Content_set_wantsTokenURI(*value, *source.wantsTokenURI);
  }
  static void build(Value<Kind::joinResponseContent>& value, const plain::JoinResponseContent& source) {
    orv_JoinResponse_Content_set_identifier(*value, copied(value, source.identifier));
    if (const auto* approval = std::get_if<plain::JoinApproval>(&source.operation)) {
      auto* const approved = orv_JoinResponse_Content_mutable_approved(*value, value.arena());
      orv_JoinResponse_Content_ApprovalContent_set_sessionIdentifier(
          approved, copied(value, approval->sessionIdentifier));
      if (!approval->memberHandles.empty()) {
        upb_StringView* handle = orv_JoinResponse_Content_ApprovalContent_resize_memberHandles(
            approved, approval->memberHandles.size(), value.arena());
        for (const plain::Text& text : approval->memberHandles) *handle++ = copied(value, text);
      }
      if (approval->userInfo)
        orv_JoinResponse_Content_ApprovalContent_set_userInfo(approved, copied(value, *approval->userInfo));
    }
  }
  static void build(Value<Kind::group>& value, const plain::Group& source) {
    if (const auto* initialization = std::get_if<plain::Initialization>(&source.event)) {
      auto* const event = orv_Group_mutable_initialize(*value, value.arena());
      orv_Group_Initialization_set_groupUUID(event, copied(value, initialization->groupUUID));
      if (initialization->members.empty()) return;
      orv_Member** member =
          orv_Group_Initialization_resize_members(event, initialization->members.size(), value.arena());
      for (const plain::Member& each : initialization->members) *member++ = built(value, each);
    } else if (const auto* added = std::get_if<plain::MemberAdded>(&source.event)) {
      auto* const event = orv_Group_mutable_memberAdded(*value, value.arena());
      orv_Group_MemberAdded_set_groupUUID(event, copied(value, added->groupUUID));
      if (added->member) orv_Group_MemberAdded_set_member(event, built(value, *added->member));
    } else if (const auto* removed = std::get_if<plain::MemberRemoved>(&source.event)) {
      auto* const event = orv_Group_mutable_memberRemoved(*value, value.arena());
      orv_Group_MemberRemoved_set_groupUUID(event, copied(value, removed->groupUUID));
      if (removed->member) orv_Group_MemberRemoved_set_member(event, built(value, *removed->member));
    } else if (const auto* left = std::get_if<plain::MemberLeft>(&source.event)) {
      auto* const event = orv_Group_mutable_memberLeft(*value, value.arena());
      orv_Group_MemberLeft_set_groupUUID(event, copied(value, left->groupUUID));
      orv_Group_MemberLeft_set_usesToken(event, left->usesToken);
    }
  }

  static std::size_t weigh(const Value<Kind::sessionMessage>& value) {
    return orv_SessionMessage_version(*value) + static_cast<std::size_t>(orv_SessionMessage_type(*value)) +
           weigh(orv_SessionMessage_data(*value));
  }
  static std::size_t weigh(const Value<Kind::connectionRequest>& value) {
    return weigh(orv_ConnectionRequest_identifier(*value)) + weigh(orv_ConnectionRequest_handle(*value)) +
           weigh(orv_ConnectionRequest_displayName(*value)) + weigh(orv_ConnectionRequest_userInfo(*value));
  }
  static std::size_t weigh(const Value<Kind::connectionResponseContent>& value) {
    const auto* const approved = orv_ConnectionResponse_Content_approved(*value);
    return weigh(orv_ConnectionResponse_Content_identifier(*value)) +
           weigh(orv_ConnectionResponse_Content_handle(*value)) +
           (approved ? weigh(orv_ConnectionResponse_Content_ApprovalContent_invitationData(approved)) : 0);
  }
  static std::size_t weigh(const Value<Kind::joinRequest>& value) {
    return weigh(orv_JoinRequest_publicKey(*value)) + weigh(orv_JoinRequest_encryptedData(*value));
  }
  static std::size_t weigh(const Value<Kind::joinRequestContent>& value) {
    return weigh(orv_JoinRequest_Content_identifier(*value)) +
           weigh(orv_JoinRequest_Content_displayName(*value)) +
           weigh(orv_JoinRequest_Content_userInfo(*value)) + orv_JoinRequest_Content_wantsTokenURI(*value);
  }
  static std::size_t weigh(const Value<Kind::joinResponseContent>& value) {
    std::size_t sum = weigh(orv_JoinResponse_Content_identifier(*value));
    if (const auto* approved = orv_JoinResponse_Content_approved(*value)) {
      sum += weigh(orv_JoinResponse_Content_ApprovalContent_sessionIdentifier(approved)) +
             weigh(orv_JoinResponse_Content_ApprovalContent_userInfo(approved));
      std::size_t size = 0;
      const upb_StringView* const handles =
          orv_JoinResponse_Content_ApprovalContent_memberHandles(approved, &size);
      for (const upb_StringView handle : std::span(handles, size)) sum += weigh(handle);
    }
    return sum;
  }
  static std::size_t weigh(const Value<Kind::group>& value) {
    switch (orv_Group_event_case(*value)) {
      case orv_Group_event_initialize: {
        const auto* const event = orv_Group_initialize(*value);
        std::size_t sum = weigh(orv_Group_Initialization_groupUUID(event));
        std::size_t size = 0;
        const orv_Member* const* const members = orv_Group_Initialization_members(event, &size);
        for (const orv_Member* member : std::span(members, size)) sum += weigh(member);
        return sum;
      }
      case orv_Group_event_memberAdded: {
        const auto* const event = orv_Group_memberAdded(*value);
        return weigh(orv_Group_MemberAdded_groupUUID(event)) + weigh(orv_Group_MemberAdded_member(event));
      }
      case orv_Group_event_memberRemoved: {
        const auto* const event = orv_Group_memberRemoved(*value);
        return weigh(orv_Group_MemberRemoved_groupUUID(event)) + weigh(orv_Group_MemberRemoved_member(event));
      }
      case orv_Group_event_memberLeft: {
        const auto* const event = orv_Group_memberLeft(*value);
        return weigh(orv_Group_MemberLeft_groupUUID(event)) + orv_Group_MemberLeft_usesToken(event);
      }
      default: return 0;
    }
  }

 private:
  static std::string_view encoded(const auto& value, const UpbArena<>& arena) {
    char* bytes = nullptr;
    std::size_t size = 0;
    if (upb_Encode(value.base(), value.description, 0, arena.get(), &bytes, &size) != kUpb_EncodeStatus_Ok)
      return {};
    return {bytes, size};
  }
  static upb_StringView copied(const auto& value, const std::string& content) {
    char* const bytes = static_cast<char*>(upb_Arena_Malloc(value.arena(), content.size()));
    std::memcpy(bytes, content.data(), content.size());
    return upb_StringView_FromDataAndSize(bytes, content.size());
  }
  static orv_Member* built(const auto& value, const plain::Member& source) {
    orv_Member* const member = orv_Member_new(value.arena());
    orv_Member_set_handle(member, copied(value, source.handle));
    if (source.tokenID) orv_Member_set_tokenID(member, copied(value, *source.tokenID));
    return member;
  }
  static std::size_t weigh(upb_StringView content) { return bench::weigh({content.data, content.size}); }
  static std::size_t weigh(const orv_Member* member) {
    return member ? weigh(orv_Member_handle(member)) + weigh(orv_Member_tokenID(member)) : 0;
  }
};

}  // namespace bench
