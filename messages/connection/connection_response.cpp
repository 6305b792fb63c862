#include <orv/connection_response.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<ConnectionResponse>;
template class Message<ConnectionResponse::Content>;
template class Message<ConnectionResponse::Content::DeniedContent>;
template class Message<ConnectionResponse::Content::ApprovalContent>;

}  // namespace orv
