#include "tests/testing/nested_messages.hpp"

#include <orv/instantiate.hpp>

template class orv::Message<orv::test::Wrapper>;
template class orv::Message<orv::test::Folder>;
