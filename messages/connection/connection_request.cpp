#include "messages/connection/connection_request.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<ConnectionRequest>;

}  // namespace orv
