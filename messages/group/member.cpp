#include <orv/member.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<Member>;

}  // namespace orv
