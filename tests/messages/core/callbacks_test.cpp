// Decoders, visitors and hooks that lie or throw.
#include <gtest/gtest.h>

#include <algorithm>

#include <orv/orv.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/scripted_decoder.hpp"
#include "tests/testing/tracing_visitor.hpp"

namespace orv::test {
namespace {

using Fields = std::vector<ScriptedField>;

// Every field of the type twice, those of nested messages too.
Fields fieldsOf(const MessageDescriptor& type) {
  Fields fields;
  for (const int round : {0, 1}) {
    for (const FieldDescriptor& field : type.fields) {
      ScriptedField& scripted = fields.emplace_back(field.number);
      switch (field.type) {
        case ValueType::string:
        case ValueType::bytes:
          scripted.value = std::string(static_cast<std::size_t>(100 * round), 'x');
          break;
        case ValueType::boolean:
        case ValueType::uint32:
        case ValueType::enumeration: scripted.value = std::int64_t{1}; break;
        case ValueType::message: scripted.value = fieldsOf(*field.message); break;
      }
    }
  }
  return fields;
}

TEST(LyingDecoder, IsAskedAgainWhateverNumberItGives) {
  constexpr std::size_t times = 1000;
  AllMessages::forEach([]<class M>() {
    std::vector<std::uint32_t> numbers{0, 1999, (1U << 29) - 1, 1U << 29, 0x7FFFFFFF, 0xFFFFFFFF};
    for (const FieldDescriptor& field : M::descriptor().fields) numbers.push_back(field.number);
    for (const std::uint32_t number : numbers) {
      SCOPED_TRACE(std::string(M::protoMessageName) + ", " + std::to_string(number));
      const Fields fields(times, {number});  // none of which it lets anybody take
      Journal journal;
      ScriptedDecoder decoder(fields, journal);
      M message;
      EXPECT_TRUE(message.decodeMessage(decoder));
      EXPECT_EQ(message, M());
      EXPECT_EQ(std::ranges::count(journal.calls, "nextFieldNumber"), times + 1);
      EXPECT_EQ(journal.calls.size(), times + 1 + (M::descriptor().field(number) == nullptr ? 0 : times));
    }
  });
}

TEST(ThrowingDecoder, LeavesWhatOneWithAnErrorLeaves) {
  AllMessages::forEach([]<class M>() {
    const Fields fields = fieldsOf(M::descriptor());
    const auto play = [&](Journal& journal) {
      M message;
      ScriptedDecoder decoder(fields, journal);
      try {
        EXPECT_EQ(message.decodeMessage(decoder).has_value(), journal.failingCall == SIZE_MAX);
        EXPECT_FALSE(journal.throws);
      } catch (const ScriptedError& error) {
        EXPECT_EQ(error, journal.error);
      }
      return message;
    };
    Journal complete;
    play(complete);
    for (std::size_t call = 0; call < complete.calls.size(); ++call) {
      SCOPED_TRACE(std::string(M::protoMessageName) + ", call " + std::to_string(call));
      const HeapMeter meter;
      {
        Journal failing{.failingCall = call}, throwing{.failingCall = call, .throws = true};
        EXPECT_EQ(play(failing), play(throwing));
        EXPECT_EQ(failing.calls, throwing.calls);
      }
      EXPECT_EQ(meter.liveBytes(), 0U);
    }
  });
}

TEST(ThrowingVisitor, EndsTheWalkAndLeavesTheMessage) {
  AllMessages::forEach([]<class M>() {
    const Fields fields = fieldsOf(M::descriptor());
    Journal journal;
    ScriptedDecoder decoder(fields, journal);
    M message;
    ASSERT_TRUE(message.decodeMessage(decoder));
    const M copy = message;
    TracingVisitor complete;
    ASSERT_TRUE(message.traverse(complete));
    for (std::size_t visit = 0; visit < complete.visits().size(); ++visit) {
      const HeapMeter meter;
      {
        const auto thrown = std::make_shared<int>();
        TracingVisitor visitor(visit, thrown, true);
        EXPECT_THROW((void)message.traverse(visitor), TracingVisitor::Error);
        EXPECT_EQ(visitor.visits().size(), visit);
      }
      EXPECT_EQ(meter.liveBytes(), 0U);
      EXPECT_EQ(message, copy);
    }
  });
}

TEST(ThrowingHook, LeavesTheGroupWhole) {
  struct Thrown {};
  const struct {
    std::string_view held;
    std::string_view input;
    int atCall;
    std::string_view left;  // a oneof that was unset is unset again
  } cases[] = {
      {"", "0A 00 22 00", 1, ""},
      {"", "0A 00 22 00 0A 00", 2, ""},
      {"0A 02 12 00", "0A 02 12 00", 1, "0A 02 12 00"},
      {"22 03 0A 01 41", "0A 00", 1, "22 03 0A 01 41"},
      {"22 03 0A 01 41", "22 02 10 01 0A 00", 2, "22 05 0A 01 41 10 01"},
      {"22 00", "28 01 0A 00", 1, "22 00 28 01"},  // what was read before stays
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.input);
    const HeapMeter meter;
    {
      Group group = Group::parse(hex(row.held)).value();
      const std::string input = hex(row.input);
      int calls = 0;
      auto hook = [&]() -> std::expected<void, DecodeError> {
        if (++calls == row.atCall) throw Thrown();
        return {};
      };
      BinaryDecoder decoder(input, hook);
      EXPECT_THROW((void)group.decodeMessage(decoder), Thrown);
      EXPECT_EQ(encoded(group), toHex(hex(row.left)));
      const Group copy = group;
      EXPECT_EQ(copy, group);
    }
    EXPECT_EQ(meter.liveBytes(), 0U);
  }
}

}  // namespace
}  // namespace orv::test
