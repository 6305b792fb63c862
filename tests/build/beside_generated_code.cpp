// A program that has both the library and protoc's code for the same schema in it, each in sources of its own.
#include <orv/group.hpp>
#include <orv/member.hpp>

#include "tests/build/generated_group.hpp"
#include "tests/testing/hex.hpp"

int main() {
  const std::string expected = orv::test::hex("12 0B 0A 02 AB CD 12 05 0A 03 41 6E 6E");
  auto group = orv::Group::parse(expected);
  const bool oursIsRight =
      group && group->memberAdded().member().handle() == "Ann" && group->serialize() == expected;
  return oursIsRight && generatedGroup() == expected ? 0 : 1;
}
