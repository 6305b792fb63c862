#include "messages/join/join_response.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<JoinResponse>;
template class Message<JoinResponse::Content>;
template class Message<JoinResponse::Content::DeniedContent>;
template class Message<JoinResponse::Content::ApprovalContent>;

}  // namespace orv
