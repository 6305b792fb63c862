#include <orv/join_request.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<JoinRequest>;
template class Message<JoinRequest::Content>;

}  // namespace orv
