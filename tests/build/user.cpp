// A program of a user of the library: it sees the public headers alone, without exceptions and type
// information, and brings a decoder and a visitor of its own.
#include <orv/orv.hpp>
#include "tests/testing/scripted_decoder.hpp"
#include "tests/testing/tracing_visitor.hpp"

namespace {

using namespace orv;

bool survivesItsJourney() {
  Group group;
  group.mutableMemberAdded().mutableMember().setHandle("guest");
  std::string stream;
  if (!appendDelimited(group, stream)) return false;
  DelimitedReader reader([&](std::span<std::byte> room) {
    const std::size_t count = stream.copy(reinterpret_cast<char*>(room.data()), room.size());
    stream.erase(0, count);
    return static_cast<std::ptrdiff_t>(count);
  });
  const auto read = reader.read<Group>();
  return read && **read == group && (*read)->hashValue() == group.hashValue();
}

bool isReadByADecoderOfItsOwn() {
  const std::vector<test::ScriptedField> fields{{1, "guest"}, {2, "token"}};
  test::Journal journal;
  test::ScriptedDecoder decoder(fields, journal);
  Member member;
  test::TracingVisitor visitor;
  return member.decodeMessage(decoder) && member.traverse(visitor) && visitor.visits().size() == 2;
}

bool refusesConflicts() {
  const std::string bytes = test::hex("0A 00 22 00");
  auto refuse = []() -> std::expected<void, DecodeError> {
    return std::unexpected(DecodeError{.cause = DecodeCause::conflictingOneOf});
  };
  BinaryDecoder decoder(std::as_bytes(std::span(bytes)), refuse);
  Group group;
  const auto result = group.decodeMessage(decoder);
  return !result && result.error().cause == DecodeCause::conflictingOneOf &&
         !group.debugDescription().empty();
}

}  // namespace

int main() { return survivesItsJourney() && isReadByADecoderOfItsOwn() && refusesConflicts() ? 0 : 1; }
