#include <orv/join_response.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<JoinResponse>;
template class Message<JoinResponse::Content>;
template class Message<JoinResponse::Content::DeniedContent>;
template class Message<JoinResponse::Content::ApprovalContent>;

}  // namespace orv
