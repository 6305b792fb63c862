// First steps: build a message, encode it, decode it again, and see what an error says.
#include <cstdio>
#include <string_view>

#include <orv/group.hpp>

int main() {
  // Changing a field in place makes it present, so a nested message is simply written to.
  orv::Group group;
  orv::Group::MemberAdded& added = group.mutableMemberAdded();
  added.setGroupUuid(orv::ByteBuffer("0123456789abcdef"));
  added.mutableMember().setHandle("anna@tablet");
  std::fputs(group.debugDescription().c_str(), stdout);

  // What can fail answers a std::expected.
  const auto bytes = group.serialize();
  if (!bytes) return 1;
  std::printf("%zu bytes\n", bytes->size());

  const auto again = orv::Group::parse(*bytes);
  if (!again) return 1;
  std::printf("%s\n", *again == group ? "the same again" : "something else");

  // A case that the oneof does not hold reads as a default, and reading changes nothing.
  std::printf("members of initialize: %zu\n", again->initialize().members().size());

  // Bytes from outside may be anything. The error says what is wrong, in which field, at which byte.
  constexpr std::size_t missing = 4;
  const auto cut = orv::Group::parse(std::string_view(*bytes).substr(0, bytes->size() - missing));
  if (cut) return 1;
  std::printf("%s\n", cut.error().message().c_str());
}
