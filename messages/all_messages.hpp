// Every message type of the protocol, in one place.
#pragma once

#include "messages/connection/connection_request.hpp"
#include "messages/connection/connection_response.hpp"
#include "messages/core/session_message.hpp"
#include "messages/group/group.hpp"
#include "messages/group/member.hpp"
#include "messages/join/join_request.hpp"
#include "messages/join/join_response.hpp"

namespace orv {

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
