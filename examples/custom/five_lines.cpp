// The five-line start: a message is set, encoded, decoded and shown.
#include <iostream>

#include <orv/group.hpp>

int main() {
  orv::Group group;
  group.mutableMemberAdded().mutableMember().setHandle("anna@tablet");
  const auto bytes = group.serialize();
  const auto again = orv::Group::parse(*bytes);
  std::cout << *again << '\n';
}
