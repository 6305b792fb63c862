// A member of a session's group.
#pragma once

#include <optional>
#include <string_view>
#include <tuple>
#include <utility>

#include <orv/message.hpp>

namespace orv::inline v0 {

// Someone who belongs to a group.
class Member final : public Message<Member> {
 public:
  static constexpr std::string_view protoMessageName = "orv.Member";

  Member() noexcept {}
  Member(const Member&) = default;
  Member(Member&&) noexcept = default;
  Member& operator=(const Member& other) { return assign(other); }
  Member& operator=(Member&& other) noexcept { return assign(std::move(other)); }

  // How the member is addressed.
  const Text& handle() const ORV_BOUND { return handle_; }
  Text& mutableHandle() { return handle_; }
  void setHandle(Text value) { handle_ = std::move(value); }

  // The token that the member joined with, if any.
  const Text& tokenID() const ORV_BOUND { return internal::valueOrDefault(tokenID_); }
  Text& mutableTokenID() { return internal::presentValue(tokenID_); }  // present from then on
  void setTokenID(Text value) { tokenID_ = std::move(value); }
  bool hasTokenID() const { return tokenID_.has_value(); }
  void clearTokenID() { tokenID_.reset(); }

 private:
  friend Message;  // the rules read the table
  Text handle_;
  std::optional<Text> tokenID_;

  static constexpr std::tuple fields{
      field<&Member::handle_>(1, "handle"),
      field<&Member::tokenID_>(2, "tokenID", secret),
  };
};

}  // namespace orv
