// The invitation that is played: who takes part, and what they say. Both sides know it, so each can tell
// whether it saw exactly what it should have.
#pragma once

#include <string_view>
#include <vector>

#include <orv/connection_request.hpp>
#include <orv/connection_response.hpp>
#include <orv/group.hpp>
#include <orv/join_request.hpp>
#include <orv/join_response.hpp>

namespace invitation::story {

struct Person {
  std::string_view name;
  std::string_view identifier;
  std::string_view handle;
  std::string_view displayName;
};

inline constexpr Person host{"host", "6F1A0C52", "living-room@home", "Living room"};
inline constexpr Person anna{"anna", "2C8E91B7", "anna@tablet", "Anna's tablet"};  // is approved
inline constexpr Person ben{"ben", "D04B7733", "ben@phone", "Ben's phone"};        // is denied

orv::ConnectionRequest connectionRequest(const Person& guest);
// The invitation data are the host's public key, to which the guest seals its join request.
orv::ConnectionResponse::Content connectionApproval(const Person& guest, orv::ByteBuffer hostKey);
orv::ConnectionResponse::Content connectionDenial(const Person& guest);

orv::JoinRequest::Content joinRequest(const Person& guest);
orv::JoinResponse::Content joinApproval(const Person& guest);

// What the host tells a guest that has joined.
std::vector<orv::Group> membershipEvents(const Person& guest);
// The event by which the guest leaves.
orv::Group farewell();

}  // namespace invitation::story
