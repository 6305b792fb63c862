#include <orv/group.hpp>

#include <orv/instantiate.hpp>

namespace orv::inline v0 {

template class Message<Group>;
template class Message<Group::Initialization>;
template class Message<Group::MemberAdded>;
template class Message<Group::MemberRemoved>;
template class Message<Group::MemberLeft>;

}  // namespace orv
