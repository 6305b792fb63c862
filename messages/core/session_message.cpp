#include <orv/session_message.hpp>

#include <orv/instantiate.hpp>

namespace orv {

template class Message<SessionMessage>;

}  // namespace orv
