// The events of a session's group.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <tuple>
#include <utility>
#include <variant>
#include <vector>

#include <orv/member.hpp>
#include <orv/message.hpp>

namespace orv::inline v0 {

// One event of a group's membership. Every event names the group by its UUID, whose bytes are not looked
// into.
class Group final : public Message<Group> {
 public:
  // The membership as a whole.
  class Initialization final : public Message<Initialization> {
   public:
    static constexpr std::string_view protoMessageName = "orv.Group.Initialization";

    Initialization() noexcept {}
    Initialization(const Initialization&) = default;
    Initialization(Initialization&&) noexcept = default;
    Initialization& operator=(const Initialization& other) { return assign(other); }
    Initialization& operator=(Initialization&& other) noexcept { return assign(std::move(other)); }

    const ByteBuffer& groupUuid() const ORV_BOUND { return groupUuid_; }
    void setGroupUuid(ByteBuffer value) { groupUuid_ = std::move(value); }

    // In the order given; duplicates are kept.
    const std::vector<Member>& members() const ORV_BOUND { return members_; }
    std::vector<Member>& mutableMembers() { return members_; }
    void setMembers(std::vector<Member> value) { members_ = std::move(value); }

   private:
    friend Message;  // the rules read the table
    ByteBuffer groupUuid_;
    std::vector<Member> members_;

    static constexpr std::tuple fields{
        field<&Initialization::groupUuid_>(1, "groupUUID"),
        field<&Initialization::members_>(2, "members"),
    };
  };

  // What the events about one member hold.
  template <class Event>
  class MemberEvent : public Message<Event> {
   public:
    const ByteBuffer& groupUuid() const ORV_BOUND { return groupUuid_; }
    void setGroupUuid(ByteBuffer value) { groupUuid_ = std::move(value); }

    const Member& member() const ORV_BOUND { return internal::valueOrDefault(member_); }
    Member& mutableMember() { return internal::presentValue(member_); }  // present from then on
    void setMember(Member value) { member_ = std::move(value); }
    bool hasMember() const { return member_.has_value(); }
    void clearMember() { member_.reset(); }

   protected:
    MemberEvent() noexcept {}

   private:
    friend Message<Event>;  // the rules read the table
    ByteBuffer groupUuid_;
    std::optional<Member> member_;

    static constexpr std::tuple fields{
        field<&MemberEvent::groupUuid_>(1, "groupUUID"),
        field<&MemberEvent::member_>(2, "member"),
    };
  };

  // A member was added to the group.
  class MemberAdded final : public MemberEvent<MemberAdded> {
   public:
    static constexpr std::string_view protoMessageName = "orv.Group.MemberAdded";

    MemberAdded() noexcept {}
    MemberAdded(const MemberAdded&) = default;
    MemberAdded(MemberAdded&&) noexcept = default;
    MemberAdded& operator=(const MemberAdded& other) { return assign(other); }
    MemberAdded& operator=(MemberAdded&& other) noexcept { return assign(std::move(other)); }
  };

  // A member was removed from the group.
  class MemberRemoved final : public MemberEvent<MemberRemoved> {
   public:
    static constexpr std::string_view protoMessageName = "orv.Group.MemberRemoved";

    MemberRemoved() noexcept {}
    MemberRemoved(const MemberRemoved&) = default;
    MemberRemoved(MemberRemoved&&) noexcept = default;
    MemberRemoved& operator=(const MemberRemoved& other) { return assign(other); }
    MemberRemoved& operator=(MemberRemoved&& other) noexcept { return assign(std::move(other)); }
  };

  // A member left the group of its own accord. The event does not name the member.
  class MemberLeft final : public Message<MemberLeft> {
   public:
    static constexpr std::string_view protoMessageName = "orv.Group.MemberLeft";

    MemberLeft() noexcept {}
    MemberLeft(const MemberLeft&) = default;
    MemberLeft(MemberLeft&&) noexcept = default;
    MemberLeft& operator=(const MemberLeft& other) { return assign(other); }
    MemberLeft& operator=(MemberLeft&& other) noexcept { return assign(std::move(other)); }

    const ByteBuffer& groupUuid() const ORV_BOUND { return groupUuid_; }
    void setGroupUuid(ByteBuffer value) { groupUuid_ = std::move(value); }

    bool usesToken() const { return usesToken_; }
    void setUsesToken(bool value) { usesToken_ = value; }

   private:
    friend Message;  // the rules read the table
    ByteBuffer groupUuid_;
    bool usesToken_ = false;

    static constexpr std::tuple fields{
        field<&MemberLeft::groupUuid_>(1, "groupUUID"),
        field<&MemberLeft::usesToken_>(2, "usesToken"),
    };
  };

  using OneOf_Event = std::variant<Initialization, MemberAdded, MemberRemoved, MemberLeft>;

  static constexpr std::string_view protoMessageName = "orv.Group";

  Group() noexcept {}
  Group(const Group&) = default;
  Group(Group&&) noexcept = default;
  Group& operator=(const Group& other) { return assign(other); }
  Group& operator=(Group&& other) noexcept { return assign(std::move(other)); }

  // Which case is held, for a switch.
  enum class EventCase : std::uint8_t { none, initialize, memberAdded, memberRemoved, memberLeft };
  EventCase eventCase() const { return internal::caseHeld<EventCase>(event_); }

  // The event as a whole: none, or one case with its payload.
  const std::optional<OneOf_Event>& event() const ORV_BOUND { return event_; }
  std::optional<OneOf_Event>& mutableEvent() { return event_; }
  void setEvent(std::optional<OneOf_Event> value) { event_ = std::move(value); }

  // A case reads as a default payload unless it is the one held. Setting it, or calling its `mutable…`, makes it
  // the one, and what was held is gone.
  const Initialization& initialize() const ORV_BOUND {
    return internal::caseOrDefault<Initialization>(event_);
  }
  Initialization& mutableInitialize() { return internal::presentCase<Initialization>(event_); }
  void setInitialize(Initialization value) { event_ = std::move(value); }

  const MemberAdded& memberAdded() const ORV_BOUND { return internal::caseOrDefault<MemberAdded>(event_); }
  MemberAdded& mutableMemberAdded() { return internal::presentCase<MemberAdded>(event_); }
  void setMemberAdded(MemberAdded value) { event_ = std::move(value); }

  const MemberRemoved& memberRemoved() const ORV_BOUND {
    return internal::caseOrDefault<MemberRemoved>(event_);
  }
  MemberRemoved& mutableMemberRemoved() { return internal::presentCase<MemberRemoved>(event_); }
  void setMemberRemoved(MemberRemoved value) { event_ = std::move(value); }

  const MemberLeft& memberLeft() const ORV_BOUND { return internal::caseOrDefault<MemberLeft>(event_); }
  MemberLeft& mutableMemberLeft() { return internal::presentCase<MemberLeft>(event_); }
  void setMemberLeft(MemberLeft value) { event_ = std::move(value); }

 private:
  friend Message;  // the rules read the table
  std::optional<OneOf_Event> event_;

  static constexpr std::tuple fields{
      field<&Group::event_, Initialization>(1, "initialize"),
      field<&Group::event_, MemberAdded>(2, "memberAdded"),
      field<&Group::event_, MemberRemoved>(3, "memberRemoved"),
      field<&Group::event_, MemberLeft>(4, "memberLeft"),
  };
};

}  // namespace orv
