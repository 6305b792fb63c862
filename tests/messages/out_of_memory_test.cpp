// What holds when memory runs out.
#include <gtest/gtest.h>

#include <functional>

#include <orv/orv.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/properties.hpp"

namespace orv::test {
namespace {

// Copies may run out of memory, and say so; what only hands over cannot.
template <class T>
constexpr bool promisesWhatItKeeps =
    std::is_nothrow_default_constructible_v<T>&& std::is_nothrow_move_constructible_v<T>&&
        std::is_nothrow_move_assignable_v<T>&& std::is_nothrow_swappable_v<T>&&
            std::is_nothrow_destructible_v<T> &&
    !std::is_nothrow_copy_constructible_v<T> && !std::is_nothrow_copy_assignable_v<T>;
static_assert(promisesWhatItKeeps<Text> && promisesWhatItKeeps<ByteBuffer> &&
              promisesWhatItKeeps<UnknownStorage> && promisesWhatItKeeps<std::optional<Group::OneOf_Event>>);
static_assert([] {
  bool holds = true;
  AllMessages::forEach([&]<class M>() { holds = holds && promisesWhatItKeeps<M>; });
  return holds;
}());

// Longer than what a text holds inside itself.
const std::string longText(100, 'x');

// What a message that memory ran out on must be.
enum class Left {
  asItWas,  // as if nothing had been called
  usable,   // some message, which can be read, written and assigned to
};

struct Sources {
  std::string bytes;
  MessagePointer message;  // of other contents than the one that is worked on
};

struct Operation {
  const char* name;
  Left left;
  std::function<void(AnyMessage& message, const Sources& sources)> run;
};

// Of all messages. Those that change nothing stand here for what they leak.
const Operation operations[] = {
    {"copying", Left::asItWas, [](auto& message, auto&) { message.copied(); }},
    {"assigning a copy", Left::asItWas, [](auto& message, auto& from) { message.assign(*from.message); }},
    {"parsing", Left::asItWas, [](auto& message, auto& from) { (void)message.parse(from.bytes); }},
    {"merging", Left::usable, [](auto& message, auto& from) { (void)message.merge(from.bytes); }},
    {"reparsing", Left::usable, [](auto& message, auto& from) { (void)message.reparse(from.bytes); }},
    {"merging what is refused in the end", Left::usable,
     [](auto& message, auto& from) { (void)message.merge(from.bytes + hex("78")); }},
    {"adding unknown fields", Left::asItWas,
     [](auto& message, auto&) {
       (void)message.mutableUnknownFields().append(std::as_bytes(std::span("\xFA\x00\x05 text", 8)));
     }},
    {"comparing", Left::asItWas, [](auto& message, auto& from) { (void)(message == *from.message); }},
    {"hashing", Left::asItWas, [](auto& message, auto&) { (void)message.hashValue(); }},
    {"describing", Left::asItWas, [](auto& message, auto&) { (void)message.debugDescription(); }},
    {"serializing", Left::asItWas, [](auto& message, auto&) { (void)message.serialize(); }},
};

TEST(OutOfMemory, LeavesEveryMessageWholeAndLeaksNothing) {
  Random random;
  std::size_t failures = 0;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(6); round > 0 && !HasFailure(); --round) {
      const std::string before = randomEncoding(type->fullName(), random);
      const std::string bytes = randomEncoding(type->fullName(), random) + hex("FA 00 01 20");
      const MessagePointer old = type->parse(before).value();
      const Sources sources{bytes, type->parse(bytes).value()};
      for (const Operation& operation : operations) {
        SCOPED_TRACE(std::string(type->fullName()) + ", " + operation.name + ", " + toHex(before) + " and " +
                     toHex(bytes));
        failures += runOutOfMemory([&] { return old->copied(); },
                                   [&](const MessagePointer& message) { operation.run(*message, sources); },
                                   [&](const MessagePointer& message) {
                                     EXPECT_EQ(faultOfEncoding(*message), "");
                                     if (operation.left == Left::asItWas) {
                                       EXPECT_EQ(encoded(*message), encoded(*old));
                                     }
                                     message->assign(*sources.message);
                                     EXPECT_EQ(*message, *sources.message);
                                   });
      }
    }
  }
  EXPECT_GT(failures, 100U);
}

// Memory runs out at each allocation of a change in turn, and the value stays as it was.
template <class T>
void expectAsItWas(const char* change, const T& old, std::invocable<T&> auto run,
                   std::size_t leastFailures = 1) {
  SCOPED_TRACE(change);
  EXPECT_GE(runOutOfMemory([&] { return old; }, run, [&](const T& value) { EXPECT_EQ(value, old); }),
            leastFailures);
}

TEST(OutOfMemory, LeavesAsItWasWhatIsSetAsAWhole) {
  const auto added = Group::MemberAdded::parse(record(2, record(1, longText)) + hex("1A 00")).value();
  const std::optional<Group::OneOf_Event> event = Group::OneOf_Event(added);
  const std::vector<Text> texts(10, longText);
  for (const Group& old : {Group(), Group::parse(hex("22 02 10 01 28 01")).value()}) {
    expectAsItWas("a oneof", old, [&](Group& group) { group.setEvent(event); });
    expectAsItWas("one case of it", old, [&](Group& group) { group.setMemberAdded(added); });
    expectAsItWas("unknown fields", old,
                  [&](Group& group) { group.setUnknownFields(added.unknownFields()); });
  }
  for (const Member& old : {Member(), Member::parse(record(1, longText) + record(2, longText)).value()}) {
    expectAsItWas("a text", old, [](Member& member) { member.setHandle(longText + longText); });
    expectAsItWas("an optional text", old, [](Member& member) { member.setTokenID(longText); });
  }
  JoinResponse::Content::ApprovalContent approval;
  for (int round = 0; round < 2; ++round) {
    expectAsItWas(
        "a list", approval, [&](auto& message) { message.setMemberHandles(texts); }, 11);
    expectAsItWas(
        "an element", approval, [](auto& message) { message.mutableMemberHandles().push_back(longText); }, 2);
    approval.setMemberHandles(texts);
  }
}

TEST(OutOfMemory, LeavesAsItWasWhatIsAppendedTo) {
  for (const std::string& old : {std::string(), std::string("a"), std::string(30, 'a'), longText}) {
    expectAsItWas("a text", Text(old), [](Text& text) { text += longText; });
    expectAsItWas("bytes", ByteBuffer(old), [](ByteBuffer& bytes) { bytes = bytes + ByteBuffer(longText); });
    expectAsItWas("a stream", old, [](std::string& stream) { (void)appendDelimited(longText, stream); });
    expectAsItWas("a message behind its length", old, [](std::string& stream) {
      (void)appendDelimited(Member::parse(record(1, longText)).value(), stream);
    });
    expectAsItWas("an encoding", old, [](std::string& output) {
      BinaryEncoder encoder(output);
      (void)Member::parse(record(1, longText)).value().traverse(encoder);
    });
  }
}

TEST(OutOfMemory, LeavesAOneofUnsetThatIsReadForTheFirstTime) {
  const std::string member = record(1, longText) + record(2, longText) + hex("18 01");
  expectAsItWas(
      "an event", Group(),
      [&](Group& group) {
        (void)group.merge(record(1, record(1, longText) + repeated(record(2, member), 9) + hex("18 01")));
      },
      30);
  expectAsItWas(
      "an event, by a decoder", Group(),
      [&](Group& group) {
        const std::string bytes = record(2, record(2, member));
        BinaryDecoder decoder(std::as_bytes(std::span(bytes)));
        (void)group.decodeMessage(decoder);
      },
      3);
}

TEST(OutOfMemory, LeavesWhatAnotherDecoderHadRead) {
  // Made before: copying such a field is not safe when memory runs out (libstdc++ 12's variant).
  const std::vector<ScriptedField> handle{{1, longText}}, handles{{2, handle}}, fields{{2, handles}};
  const Group whole = Group::parse(record(2, record(2, record(1, longText)))).value();
  EXPECT_GT(runOutOfMemory([] { return Group(); },
                           [&](Group& group) {
                             Journal journal;
                             ScriptedDecoder decoder(fields, journal);
                             (void)group.decodeMessage(decoder);
                           },
                           [&](const Group& group) { EXPECT_TRUE(group == Group() || group == whole); }),
            3U);
}

}  // namespace
}  // namespace orv::test
