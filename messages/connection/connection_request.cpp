#include <orv/connection_request.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<ConnectionRequest>;

}  // namespace orv
