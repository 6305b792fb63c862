#include "messages/group/member.hpp"

#include "messages/core/built_in.hpp"

namespace orv {

template class Message<Member>;

}  // namespace orv
