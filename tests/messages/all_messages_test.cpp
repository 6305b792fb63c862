// What holds for every message.
#include <gtest/gtest.h>

#include <concepts>

#include <orv/orv.hpp>
#include <orv/text_renderer.hpp>
#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/properties.hpp"

namespace orv::test {
namespace {

// Field 15 is defined nowhere.
const std::string unknownRecord = hex("F8 00 81 00");

// What every type offers to the standard library.
static_assert([] {
  bool holds = true;
  // Too large an object is paid for in every list and oneof. A standard library's own checks make vectors larger.
  constexpr std::size_t largest = 192 + sizeof(std::vector<int>) - 3 * sizeof(void*);
  AllMessages::forEach([&]<class M>() {
    holds = holds && std::regular<M> && std::totally_ordered<M> && sizeof(M) <= largest &&
            std::is_same_v<std::invoke_result_t<std::hash<M>, const M&>, std::size_t> &&
            DecoderOf<BinaryDecoder, M> && VisitorOf<BinaryEncoder, M> && VisitorOf<TextRenderer, M>;
  });
  return holds;
}());

// Runs the body with two encodings of each type that are random, valid and independent of each other.
template <class Body>
void forRandomEncodings(Body&& body) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(200); round > 0 && !::testing::Test::HasFailure(); --round) {
      const std::string left = randomEncoding(type->fullName(), random);
      const std::string right = randomEncoding(type->fullName(), random);
      SCOPED_TRACE(std::string(type->fullName()) + ", encodings " + toHex(left) + " and " + toHex(right));
      body(*type, left, right);
    }
  }
}

TEST(AllMessages, AreEmptyByDefault) {
  for (const MessagePointer& message : allMessages()) {
    SCOPED_TRACE(message->fullName());
    EXPECT_EQ(encoded(*message), "");
    EXPECT_EQ(message->debugDescription(), "");
    EXPECT_TRUE(message->isInitialized());
    EXPECT_EQ(*message->parse("").value(), *message);
    EXPECT_EQ(*message->parse(std::span<const std::byte>()).value(), *message);
    EXPECT_EQ(faultOfEncoding(*message), "");
  }
}

TEST(AllMessages, HaveADefaultThatNobodyMade) {
  AllMessages::forEach([]<class M>() {
    SCOPED_TRACE(M::protoMessageName);
    const M& shared = internal::defaultInstance<M>();
    EXPECT_EQ(shared, M());
    EXPECT_EQ(M(shared), M());
    EXPECT_EQ(encoded(shared), "");
    EXPECT_EQ(shared.hashValue(), M().hashValue());
  });
}

TEST(AllMessages, RoundTrip) {
  forRandomEncodings([](const AnyMessage& type, const std::string& left, const std::string&) {
    EXPECT_EQ(faultOfReading(type, left), "");
  });
}

TEST(AllMessages, AreEqualAndHashAlikeWhenTheirEncodingsAreTheSame) {
  forRandomEncodings([](const AnyMessage& type, const std::string& leftBytes, const std::string& rightBytes) {
    const MessagePointer left = type.parse(leftBytes).value(), right = type.parse(rightBytes).value();
    const bool areSame = leftBytes == rightBytes;
    EXPECT_EQ(*left == *right, areSame);
    EXPECT_EQ(*right == *left, areSame);
    EXPECT_EQ(left->hashValue() == right->hashValue(), areSame);
    EXPECT_EQ(left->order(*right) == 0, areSame);
    EXPECT_EQ(left->order(*right), 0 <=> right->order(*left));
  });
}

TEST(AllMessages, AreUnequalToMessagesOfOtherTypes) {
  for (const MessagePointer& left : allMessages()) {
    for (const MessagePointer& right : allMessages()) EXPECT_EQ(*left == *right, left == right);
  }
}

TEST(AllMessages, MergeAsIfOneEncodingStoodBehindTheOther) {
  forRandomEncodings([](const AnyMessage& type, const std::string& left, const std::string& right) {
    const MessagePointer merged = type.parse(left).value();
    ASSERT_TRUE(merged->merge(right));
    EXPECT_EQ(*merged, *type.parse(left + right).value());
    const auto official = newOfficial(type.fullName());
    ASSERT_TRUE(official->ParseFromString(left + right));
    EXPECT_EQ(encoded(*merged), toHex(official->SerializeAsString()));
  });
}

TEST(AllMessages, AreReplacedWhenTheirMemoryIsUsedAgain) {
  forRandomEncodings([](const AnyMessage& type, const std::string& left, const std::string& right) {
    const MessagePointer reused = type.parse(left).value();
    ASSERT_TRUE(reused->reparse(right));
    EXPECT_EQ(encoded(*reused), encoded(*type.parse(right).value()));
    // Cut somewhere, and then mostly refused, an encoding leaves the same as in a new message.
    for (std::size_t cut = left.size(); cut > 0; cut -= (cut + 2) / 3) {
      const MessagePointer fresh = type.copied();
      const auto result = fresh->merge(left.substr(0, cut) + hex("78"));
      EXPECT_EQ(reused->reparse(left.substr(0, cut) + hex("78")), result);
      EXPECT_EQ(encoded(*reused), encoded(*fresh)) << "cut to " << cut;
      ASSERT_TRUE(reused->reparse(right));
    }
  });
}

// A field of another wire type than its own is unknown, and leaves nothing of what the memory held.
TEST(AllMessages, AreReplacedByFieldsOfEveryWireType) {
  for (const MessagePointer& type : allMessages()) {
    for (const FieldDescriptor& field : type->descriptor().fields) {
      const auto tag = [&](WireType wireType) {
        return varint(field.number << 3 | static_cast<unsigned>(wireType));
      };
      const std::string records[] = {tag(WireType::varint) + hex("01"), tag(WireType::fixed64) + hex("01*8"),
                                     tag(WireType::fixed32) + hex("01*4"),
                                     tag(WireType::lengthDelimited) + hex("00"),
                                     tag(WireType::startGroup) + tag(WireType::endGroup)};
      for (const std::string& held : records) {
        for (const std::string& bytes : records) {
          const MessagePointer reused = type->parse(held).value();
          ASSERT_TRUE(reused->reparse(bytes));
          EXPECT_EQ(encoded(*reused), encoded(*type->parse(bytes).value()))
              << type->fullName() << ": " << toHex(held) << ", and then " << toHex(bytes);
        }
      }
    }
  }
}

TEST(AllMessages, KeepWhatWasReadBeforeAnError) {
  forRandomEncodings([](const AnyMessage& type, const std::string& left, const std::string& right) {
    const MessagePointer merged = type.parse(left).value();
    EXPECT_FALSE(merged->merge(right + unknownRecord + hex("78")));
    EXPECT_EQ(*merged, *type.parse(left + right + unknownRecord).value());
  });
}

TEST(AllMessages, KeepUnknownFieldsByteForByteAndLast) {
  forRandomEncodings([](const AnyMessage& type, const std::string& bytes, const std::string&) {
    const MessagePointer without = type.parse(bytes).value();
    const MessagePointer with = type.parse(unknownRecord + bytes + unknownRecord).value();
    EXPECT_TRUE(encoded(*with).ends_with(toHex(unknownRecord)));
    EXPECT_EQ(with->encodedSize(), without->encodedSize() + 2 * unknownRecord.size());
    EXPECT_FALSE(*with == *without);
    EXPECT_FALSE(*without == *with);
    with->mutableUnknownFields() = without->mutableUnknownFields();
    EXPECT_EQ(*with, *without);
  });
}

TEST(AllMessages, AreValuesThatShareNothing) {
  forRandomEncodings([](const AnyMessage& type, const std::string& bytes, const std::string& more) {
    const std::string kept = encoded(*type.parse(bytes).value());
    const MessagePointer original = type.parse(bytes).value();
    const MessagePointer copy = original->copied();
    ASSERT_TRUE(copy->merge(more + unknownRecord));
    EXPECT_EQ(encoded(*original), kept);
    const std::string changed = encoded(*copy);

    const MessagePointer assigned = type.parse(more).value();
    assigned->assign(*original);
    ASSERT_TRUE(original->merge(more + unknownRecord));
    EXPECT_EQ(encoded(*assigned), kept);
    EXPECT_EQ(encoded(*original), changed);

    assigned->assign(*assigned);
    EXPECT_EQ(encoded(*assigned), kept);
    assigned->assignMoved(*assigned);
    EXPECT_EQ(encoded(*assigned), kept);
    const MessagePointer moved = assigned->moved();
    EXPECT_EQ(encoded(*moved), kept);
    copy->assignMoved(*moved);
    EXPECT_EQ(encoded(*copy), kept);
    moved->assign(*original);  // a moved-from message can be assigned to
    EXPECT_EQ(encoded(*moved), changed);
  });
}

}  // namespace
}  // namespace orv::test
