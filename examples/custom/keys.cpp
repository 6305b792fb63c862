// Messages as keys: equal messages hash alike, and are ordered as they are equal.
#include <iostream>
#include <map>
#include <set>
#include <unordered_map>
#include <utility>

#include <orv/member.hpp>
#include <orv/session_message.hpp>

namespace {

orv::Member memberCalled(orv::Text handle) {
  orv::Member member;
  member.setHandle(std::move(handle));
  return member;
}

}  // namespace

int main() {
  std::unordered_map<orv::Member, int> greetings;
  for (const char* const handle : {"zo\u00EB", "anna", "zoe\u0308", "anna", "ben"})
    ++greetings[memberCalled(handle)];
  std::cout << greetings.size() << " members, zoë " << greetings[memberCalled("zo\u00EB")] << " times\n";

  // In the order of their fields. A token that is absent comes before one that is empty.
  orv::Member withToken = memberCalled("anna");
  withToken.mutableTokenID();
  std::set<orv::Member> sorted{withToken};
  for (const auto& [member, count] : greetings) sorted.insert(member);
  for (const orv::Member& member : sorted) std::cout << member << '\n';

  std::map<orv::VessaSessionMessageType, int> counts;
  ++counts[orv::VessaSessionMessageType::groupMessage];
  ++counts[orv::VessaSessionMessageType::joinRequest];
  for (const auto& [type, count] : counts) std::cout << type << ": " << count << '\n';
}
