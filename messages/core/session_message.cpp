#include "messages/core/session_message.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<SessionMessage>;

}  // namespace orv
