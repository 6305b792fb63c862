#include <orv/session_message.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<SessionMessage>;

}  // namespace orv
