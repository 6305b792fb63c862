#include <orv/member.hpp>

#include <orv/instantiate.hpp>

namespace orv {

template class Message<Member>;

}  // namespace orv
