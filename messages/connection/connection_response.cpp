#include "messages/connection/connection_response.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<ConnectionResponse>;
template class Message<ConnectionResponse::Content>;
template class Message<ConnectionResponse::Content::DeniedContent>;
template class Message<ConnectionResponse::Content::ApprovalContent>;

}  // namespace orv
