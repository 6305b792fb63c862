#include "messages/join/join_request.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<JoinRequest>;
template class Message<JoinRequest::Content>;

}  // namespace orv
