// A user of the code that protoc makes of the schema as it stands: its classes are called like the library's.
#include "tests/build/generated_group.hpp"

#include <orv.pb.h>

std::string generatedGroup() {
  orv::Group group;
  group.mutable_memberadded()->set_groupuuid("\xAB\xCD");
  group.mutable_memberadded()->mutable_member()->set_handle("Ann");
  return group.SerializeAsString();
}
