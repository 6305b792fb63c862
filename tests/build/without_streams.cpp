// A program that has no streams of messages: linked without libprotobuf, which serves streams alone.
#include <orv/group.hpp>

int main() {
  const auto group = orv::Group::parse("\x22\x00");
  if (!group || group->debugDescription() != "memberLeft {\n}\n") return 1;
  return group->serialize() == std::string("\x22\x00", 2) ? 0 : 1;
}
