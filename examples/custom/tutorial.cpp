// The program of docs/tutorial.md: makes a message, reads and changes it, keeps a file of messages, and looks for
// something in them with a visitor of its own.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <expected>
#include <fstream>
#include <iostream>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include <orv/any_value_visitor.hpp>
#include <orv/delimited_stream.hpp>
#include <orv/group.hpp>

namespace {

// A group to which a member was added.
orv::Group added(const orv::Text& handle) {
  orv::Group group;
  orv::Group::MemberAdded& event = group.mutableMemberAdded();
  event.setGroupUuid("living room");
  event.mutableMember().setHandle(handle);
  return group;
}

// Whatever can fail answers a std::expected.
int makeAndRead() {
  const orv::Group group = added("anna@tablet");
  const std::expected<std::string, orv::EncodeError> bytes = group.serialize();
  if (!bytes) return 1;
  const std::expected<orv::Group, orv::DecodeError> again = orv::Group::parse(*bytes);
  if (!again) return 1;
  std::cout << bytes->size() << " bytes: " << *again << '\n';
  std::cout << (*again == group ? "equal" : "different") << '\n';

  const auto cut = orv::Group::parse(bytes->substr(0, 20));
  if (!cut) std::cout << cut.error() << '\n';
  return 0;
}

void change() {
  orv::Group group = added("anna@tablet");
  group.mutableMemberAdded().mutableMember().setTokenID("t1");
  std::cout << group << '\n';
  group.mutableMemberLeft().setUsesToken(true);  // another case: the added member is gone
  std::cout << group << '\n';
  std::cout << '"' << group.memberAdded().member().handle() << "\"\n";
}

// Each message behind its length.
bool write(const std::vector<orv::Group>& groups, const std::string& path) {
  std::string bytes;
  for (const orv::Group& group : groups) {
    if (!orv::appendDelimited(group, bytes)) return false;
  }
  return static_cast<bool>(std::ofstream(path, std::ios::binary) << bytes);
}

// The reader asks for bytes; where they come from is the program's affair.
orv::DelimitedReader readerOf(const std::string& path) {
  return orv::DelimitedReader(
      [file = std::make_unique<std::ifstream>(path, std::ios::binary)](std::span<std::byte> room) {
        file->read(reinterpret_cast<char*>(room.data()), static_cast<std::streamsize>(room.size()));
        return static_cast<std::ptrdiff_t>(file->bad() ? -1 : file->gcount());
      });
}

// Collects the handles of a message, however deep they stand.
class HandleCollector : public orv::AnyValueVisitor<HandleCollector> {
 public:
  std::vector<std::string> handles;

  Result visitAnyValue(const orv::Text& value, std::uint32_t number) {
    if (fieldName(number) == "handle") handles.emplace_back(value.utf8());
    return {};
  }
  // Everything that is no text.
  template <class T>
  Result visitAnyValue(const T&, std::uint32_t) {
    return {};
  }
};

}  // namespace

int main() {
  if (makeAndRead() != 0) return 1;
  change();

  const std::string path = "tutorial.capture";
  if (!write({added("anna@tablet"), added("ben@phone"), orv::Group()}, path)) return 1;
  orv::DelimitedReader reader = readerOf(path);
  HandleCollector collector;
  auto next = reader.read<orv::Group>();
  for (; next && *next; next = reader.read<orv::Group>()) {
    if (!(*next)->traverse(collector)) return 1;
  }
  if (!next) std::cout << next.error() << '\n';
  for (const std::string& handle : collector.handles) std::cout << handle << '\n';
  std::remove(path.c_str());
}
