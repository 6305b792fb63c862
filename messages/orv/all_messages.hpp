// Every message type of the protocol, in one place.
#pragma once

#include <orv/connection_request.hpp>
#include <orv/connection_response.hpp>
#include <orv/group.hpp>
#include <orv/join_request.hpp>
#include <orv/join_response.hpp>
#include <orv/member.hpp>
#include <orv/session_message.hpp>

namespace orv::inline v0 {

// A list of types, to run one piece of code over all of them:
//
//   AllMessages::forEach([]<class M>() { std::puts(std::string(M::protoMessageName).c_str()); });
template <class... Types>
struct TypeList {
  static constexpr std::size_t size = sizeof...(Types);

  template <class Visit>
  static constexpr void forEach(Visit&& visit) {
    (visit.template operator()<Types>(), ...);
  }
};

using AllMessages = TypeList<  //
    SessionMessage,            //
    ConnectionRequest,         //
    ConnectionResponse, ConnectionResponse::Content, ConnectionResponse::Content::ApprovalContent,
    ConnectionResponse::Content::DeniedContent,  //
    JoinRequest, JoinRequest::Content,           //
    JoinResponse, JoinResponse::Content, JoinResponse::Content::ApprovalContent,
    JoinResponse::Content::DeniedContent,  //
    Member,                                //
    Group, Group::Initialization, Group::MemberAdded, Group::MemberRemoved, Group::MemberLeft>;

}  // namespace orv
