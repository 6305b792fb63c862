// Decoders, conflict hooks and visitors that are not the library's.
#include <gtest/gtest.h>

#include <algorithm>

#include <orv/any_value_decoder.hpp>
#include <orv/any_value_visitor.hpp>
#include <orv/orv.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/scripted_decoder.hpp"
#include "tests/testing/tracing_visitor.hpp"

namespace orv::test {
namespace {

using Fields = std::vector<ScriptedField>;
using Calls = std::vector<std::string>;

// A decoder that lacks an operation for any message is no decoder of messages, rather than an error in the
// rules.
struct DecoderWithoutNumbers : ScriptedDecoder {
  void nextFieldNumber();
};
static_assert(DecoderOf<ScriptedDecoder, Group> && !DecoderOf<DecoderWithoutNumbers, Group>);
struct VisitorWithoutMessages : TracingVisitor {
  void visitSingularMessageField();
};
static_assert(VisitorOf<TracingVisitor, Group> && !VisitorOf<VisitorWithoutMessages, Group>);

TEST(CustomDecoder, IsAskedForEachFieldAndForTheHookAfterTheReading) {
  const Fields fields{{1, "a"}, {9, 1}, {3, Fields{}}, {4, Fields{{2, "b"}, {2, "c"}}}, {4, Fields{{1, "s"}}},
                      {3}};
  Journal journal;
  ScriptedDecoder decoder(fields, journal);
  JoinResponse::Content content;
  ASSERT_TRUE(content.decodeMessage(decoder));
  EXPECT_EQ(encoded(content), "0A 01 61 22 09 0A 01 73 12 01 62 12 01 63");
  const std::string next = "nextFieldNumber", hook = "handleConflictingOneOf", text = "repeated string",
                    denied = "message orv.JoinResponse.Content.DeniedContent",
                    approved = "message orv.JoinResponse.Content.ApprovalContent";
  EXPECT_EQ(journal.calls, (Calls{next,     "string", next,     next, denied, next,  //
                                  next,     approved, next,     text, next,   text, next,   hook, next,
                                  approved, next,     "string", next, hook,   next, denied, next}));
}

// The fields of an encoding, as a script.
Fields scriptOf(const MessageDescriptor* type, std::string_view bytes) {
  Fields fields;
  const UnknownStorage records = UnknownStorage::checked(std::as_bytes(std::span(bytes))).value();
  for (const UnknownField& record : records) {
    ScriptedField& scripted = fields.emplace_back(record.tag.fieldNumber());
    const FieldDescriptor* const field = type->field(scripted.number);
    WireReader reader(record.value);
    if (field == nullptr) continue;
    if (record.tag.wireType() == WireType::varint) {
      scripted.value = static_cast<std::int64_t>(reader.readVarint().value());
    } else if (record.tag.wireType() == WireType::lengthDelimited) {
      const auto body = reader.readLengthDelimited().value();
      const std::string_view contents(reinterpret_cast<const char*>(body.data()), body.size());
      if (field->type == ValueType::message) {
        scripted.value = scriptOf(field->message, contents);
      } else {
        scripted.value = std::string(contents);
      }
    }
  }
  return fields;
}

TEST(CustomDecoder, EndsTheDecodingWithTheErrorOfItsNthCall) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    const std::string bytes =
        randomEncoding(type->fullName(), random) + randomEncoding(type->fullName(), random);
    const Fields fields = scriptOf(&type->descriptor(), bytes);
    const auto play = [&](std::size_t count, Journal& journal, AnyMessage& message) {
      ScriptedDecoder decoder(std::span<const ScriptedField>(fields).first(count), journal);
      return message.decode(decoder);
    };
    Journal complete;
    ASSERT_TRUE(play(fields.size(), complete, *type->copied()));
    for (std::size_t call = 0; call < complete.calls.size(); ++call) {
      SCOPED_TRACE(std::string(type->fullName()) + ", call " + std::to_string(call) + ", " +
                   complete.calls[call]);
      Journal journal{.failingCall = call};
      const MessagePointer message = type->copied();
      const auto result = play(fields.size(), journal, *message);
      ASSERT_FALSE(result);
      EXPECT_EQ(result.error(), journal.error);
      EXPECT_EQ(journal.calls.size(), call + 1);
      // The field that failed leaves nothing behind, those before it are there.
      Journal other;
      const MessagePointer before = type->copied();
      ASSERT_TRUE(play(journal.fieldsDone, other, *before));
      EXPECT_EQ(*message, *before);
    }
  }
}

TEST(CustomDecoder, MayRefuseConflicts) {
  Journal journal{.refusesConflicts = true};
  const Fields fields{{4, Fields{{1, "s"}}}, {4, Fields{{2, "b"}}}};
  ScriptedDecoder decoder(fields, journal);
  JoinResponse::Content content;
  EXPECT_EQ(content.decodeMessage(decoder), std::unexpected(journal.error));
  EXPECT_EQ(encoded(content), "22 03 0A 01 73");
}

TEST(CustomDecoder, ThatTakesNoPayloadSetsNoCase) {
  Journal journal;
  const Fields fields{{1}, {4, Fields{}}, {1}};
  ScriptedDecoder decoder(fields, journal);
  Group group;
  ASSERT_TRUE(group.decodeMessage(decoder));
  EXPECT_EQ(encoded(group), "22 00");
  EXPECT_EQ(std::ranges::count(journal.calls, "handleConflictingOneOf"), 0);
}

TEST(ConflictHook, IsAskedOncePerOccurrenceWhereACaseIsHeld) {
  const struct {
    std::string_view input;
    int askedTimes;
    std::string_view whenRefused;  // what the group holds then
  } cases[] = {
      {"0A 00", 0, "0A 00"},
      {"0A 00 22 00", 1, "0A 00"},
      {"0A 02 12 00 0A 02 12 00", 1, "0A 02 12 00"},
      {"22 03 0A 01 41 22 02 10 01", 1, "22 03 0A 01 41"},
      {"22 00 0A 00 22 00 22 00", 3, "22 00"},
      {"08 01 0A 00", 0, "0A 00 08 01"},        // what is not taken sets nothing
      {"0A 00 10 01", 0, "0A 00 10 01"},        // and does not conflict
      {"0A 02 12 00 08 01", 1, "0A 02 12 00"},  // unless the payload was there before
      {"0A 00 0D 01*4 0B 0C", 2, "0A 00"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.input);
    const std::string input = hex(row.input);
    const auto bytes = std::as_bytes(std::span(input));
    int asked = 0;
    auto counting = [&]() -> std::expected<void, DecodeError> {
      return (++asked, std::expected<void, DecodeError>());
    };
    BinaryDecoder accepting(bytes, counting);
    Group group;
    ASSERT_TRUE(group.decodeMessage(accepting));
    EXPECT_EQ(asked, row.askedTimes);
    EXPECT_EQ(group, Group::parse(input).value());

    const DecodeError refusal{.cause = DecodeCause::conflictingOneOf, .length = 7, .offset = 123456};
    const auto refusing = [&]() -> std::expected<void, DecodeError> { return std::unexpected(refusal); };
    BinaryDecoder decoder(bytes, refusing);
    Group refused;
    const auto result = refused.decodeMessage(decoder);
    if (row.askedTimes == 0) {
      EXPECT_TRUE(result);
    } else {
      EXPECT_EQ(result, std::unexpected(refusal));
    }
    EXPECT_EQ(encoded(refused), toHex(hex(row.whenRefused)));
  }
}

TEST(ConflictHook, IsNotAskedAboutAPayloadThatCannotBeRead) {
  const std::string input = hex("0A 02 12 00 0A 02 12 05");
  bool isAsked = false;
  auto hook = [&]() -> std::expected<void, DecodeError> {
    return (isAsked = true, std::expected<void, DecodeError>());
  };
  BinaryDecoder decoder(std::as_bytes(std::span(input)), hook);
  Group group;
  EXPECT_FALSE(group.decodeMessage(decoder));
  EXPECT_FALSE(isAsked);
  EXPECT_EQ(encoded(group), "0A 02 12 00");
}

template <class M>
Calls visitsOf(const M& message) {
  TracingVisitor visitor;
  EXPECT_TRUE(message.traverse(visitor));
  return visitor.visits();
}

TEST(CustomVisitor, IsHandedWhatIsToBeEmittedInAscendingOrder) {
  EXPECT_EQ(visitsOf(Group()), Calls());
  EXPECT_EQ(visitsOf(SessionMessage::parse(hex("22 00 1A 00 10 09 08 00")).value()),
            (Calls{"1 uint32 0", "2 enum 9", "3 bytes ", "0 unknown 22 00"}));
  EXPECT_EQ(visitsOf(JoinRequest::Content::parse(hex("28 00 0A 00 1A 00")).value()),
            (Calls{"3 string ", "5 bool false"}));
  EXPECT_EQ(visitsOf(JoinResponse::Content::parse(hex("22 08 12 00 12 01 61 0A 01 73")).value()),
            (Calls{"4 message orv.JoinResponse.Content.ApprovalContent", "1 string s", "2 2 strings"}));
  EXPECT_EQ(visitsOf(Group::parse(hex("0A 07 12 00 12 03 12 01 74")).value()),
            (Calls{"1 message orv.Group.Initialization", "2 2 messages", "2 string t"}));
}

TEST(CustomVisitor, EndsTheWalkWithTheErrorOfItsNthVisit) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    const MessagePointer message =
        type->parse(randomEncoding(type->fullName(), random) + hex("F8 00 01")).value();
    TracingVisitor complete;
    ASSERT_TRUE(message->traverse(complete));
    const Calls& all = complete.visits();
    for (std::size_t count = 0; count < all.size(); ++count) {
      SCOPED_TRACE(std::string(type->fullName()) + ", visit " + std::to_string(count) + ", " + all[count]);
      const auto error = std::make_shared<int>();
      TracingVisitor visitor(count, error);
      EXPECT_EQ(message->traverse(visitor), std::unexpected(TracingVisitor::Error(error)));
      EXPECT_EQ(visitor.visits(), Calls(all.begin(), all.begin() + static_cast<std::ptrdiff_t>(count)));
    }
  }
}

// Takes every second value, and refuses that of one call.
class EverySecond : public AnyValueDecoder<EverySecond, std::size_t> {
 public:
  EverySecond(std::span<const std::uint32_t> numbers, std::size_t refused)
      : numbers_(numbers), refused_(refused) {}

  template <class M>
  std::expected<std::optional<std::uint32_t>, Error> nextFieldNumber(M&) {
    if (numbers_.empty()) return std::nullopt;
    const std::uint32_t number = numbers_.front();
    numbers_ = numbers_.subspan(1);
    return number;
  }
  template <class T>
  std::expected<bool, Error> readAnyValue(T& value) {
    value = T(1);
    return answer();
  }
  std::expected<bool, Error> readAnyValue(Text& value) {
    value = "x";
    return answer();
  }
  std::expected<bool, Error> readAnyValue(ByteBuffer& value) {
    value = ByteBuffer("x");
    return answer();
  }
  template <class M>
  std::expected<bool, Error> readAnyMessage(M& message) {
    EXPECT_TRUE(message.merge(hex("78 01")));
    return answer();
  }

 private:
  std::expected<bool, Error> answer() {
    if (count_ == refused_) return std::unexpected(count_);
    return count_++ % 2 == 0;
  }

  std::span<const std::uint32_t> numbers_;
  std::size_t refused_;
  std::size_t count_ = 0;
};

TEST(AnyValueDecoder, StoresWhatItsReaderTakes) {
  AllMessages::forEach([]<class M>() {
    for (const FieldDescriptor& field : M::descriptor().fields) {
      SCOPED_TRACE(std::string(M::protoMessageName) + "." + std::string(field.name));
      // What is taken once, and what is taken twice, with one that is not taken between them.
      const std::vector<std::uint32_t> numbers(3, field.number);
      const auto decoded = [&](std::size_t count, std::size_t refused = SIZE_MAX) {
        EverySecond decoder{std::span(numbers).first(count), refused};
        M message;
        const auto result = message.decodeMessage(decoder);
        if (refused < count) {
          EXPECT_EQ(result, std::unexpected(refused));
        } else {
          EXPECT_TRUE(result);
        }
        return message;
      };
      EXPECT_NE(decoded(1), M());
      EXPECT_EQ(decoded(2), decoded(1));
      EXPECT_EQ(decoded(3, 0), M());
      EXPECT_EQ(decoded(3, 2), decoded(1));
      const bool isAdded = field.kind == FieldKind::repeated || field.type == ValueType::message;
      EXPECT_EQ(decoded(3) != decoded(1), isAdded);
    }
  });
}

// Counts what it is handed, the beginnings of messages too, and refuses one.
class Counting : public AnyValueVisitor<Counting, std::size_t> {
 public:
  explicit Counting(std::size_t refused) : refused_(refused) {}
  std::size_t count() const { return count_; }

  template <class T>
  Result visitAnyValue(const T&, std::uint32_t) {
    return answer();
  }
  template <class M>
  Result beginMessage(const M& message, std::size_t fieldCount) {
    if (auto answered = answer(); !answered) return answered;
    return AnyValueVisitor::beginMessage(message, fieldCount);
  }

 private:
  Result answer() {
    if (count_ == refused_) return std::unexpected(count_);
    ++count_;
    return {};
  }

  std::size_t refused_;
  std::size_t count_ = 0;
};

TEST(AnyValueVisitor, EndsTheWalkWithTheErrorOfItsReader) {
  Random random;
  AllMessages::forEach([&]<class M>() {
    for (int round = 0; round < 20; ++round) {
      const M message = M::parse(randomEncoding(M::protoMessageName, random)).value();
      Counting complete(SIZE_MAX);
      ASSERT_TRUE(message.traverse(complete));
      for (std::size_t refused = 0; refused < complete.count(); ++refused) {
        Counting visitor(refused);
        EXPECT_EQ(message.traverse(visitor), std::unexpected(refused)) << M::protoMessageName;
        EXPECT_EQ(visitor.count(), refused);
      }
    }
  });
}

}  // namespace
}  // namespace orv::test
