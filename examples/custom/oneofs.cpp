// What a oneof holds: by a switch over its cases, by one case's type, or by a function for each.
#include <iostream>
#include <variant>

#include <orv/group.hpp>

namespace {

using orv::Group;

// The compiler warns where a case is missing.
const char* nameOf(const Group& group) {
  switch (group.eventCase()) {
    case Group::EventCase::none: return "nothing";
    case Group::EventCase::initialize: return "a start";
    case Group::EventCase::memberAdded: return "a new member";
    case Group::EventCase::memberRemoved: return "a member less";
    case Group::EventCase::memberLeft: return "a goodbye";
  }
  return "";
}

template <class... Functions>
struct Overloaded : Functions... {
  using Functions::operator()...;
};

void tell(const Group& group) {
  std::cout << nameOf(group) << ": ";
  if (const auto* added = orv::held<Group::MemberAdded>(group.event()))
    std::cout << "hello, " << added->member().handle() << "! ";
  if (!group.event()) {
    std::cout << "-\n";
    return;
  }
  // It does not compile where a case has no function.
  std::visit(
      Overloaded{
          [](const Group::Initialization& event) { std::cout << event.members().size() << " members\n"; },
          [](const Group::MemberLeft& event) { std::cout << "token " << event.usesToken() << '\n'; },
          [](const auto& event) { std::cout << event.member().handle() << '\n'; },
      },
      *group.event());
}

}  // namespace

int main() {
  Group group;
  tell(group);
  group.mutableInitialize().mutableMembers().emplace_back().setHandle("anna@tablet");
  tell(group);
  group.mutableMemberAdded().mutableMember().setHandle("ben@phone");
  tell(group);
  // What another case holds reads as a default, and reading changes nothing.
  std::cout << group.memberLeft().usesToken() << " and still " << nameOf(group) << '\n';
  group.mutableMemberLeft().setUsesToken(true);
  tell(group);
}
