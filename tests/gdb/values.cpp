// Values for gdb to show.
#include <string>

#include <orv/all_messages.hpp>

namespace {

[[gnu::noinline]] void stop(const void* value) { asm volatile("" : : "r"(value) : "memory"); }

}  // namespace

int main() {
  using namespace orv::literals;
  const orv::Text shortText = "zo\u00EB@phone";
  const orv::Text longText = std::string(60, 'a');
  const orv::Text emptyText;
  const orv::ByteBuffer bytes = "\x0a\x00\xff"_bytes;
  const orv::ByteBuffer longBytes = std::string(50, '\x01');
  const auto member = *orv::Member::parse("\x0A\x03\x41\x6E\x6E\x48\x01"_bytes);
  orv::Group group;
  group.mutableMemberAdded().setGroupUuid("\xab\xcd"_bytes);
  group.mutableMemberAdded().setMember(member);
  orv::Group::Initialization members;
  members.setMembers({member, member});
  orv::SessionMessage envelope;
  envelope.setVersion(0);
  envelope.setData({});
  const orv::Group nothing;
  stop(&group);
  stop(&shortText);
  stop(&longText);
  stop(&emptyText);
  stop(&bytes);
  stop(&longBytes);
  stop(&members);
  stop(&envelope);
  stop(&nothing);
}
