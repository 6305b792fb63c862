#include <orv/connection_request.hpp>

#include <orv/instantiate.hpp>

namespace orv {

template class Message<ConnectionRequest>;

}  // namespace orv
