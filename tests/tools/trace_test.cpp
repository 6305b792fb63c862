// The tracing decoder, over random and damaged messages of every type.
#include "tools/orv/inspect/trace.hpp"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include <orv/all_messages.hpp>
#include <orv/byte_view.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/random.hpp"

namespace orv::test {
namespace {

constexpr std::size_t roundsPerType = 2000;

// Holds the records against the bytes: those of a record stand behind those of the one before, so that all
// are shown.
class Seamless final : public tool::TraceSink {
 public:
  explicit Seamless(std::span<const std::byte> bytes) : shownUpTo_(bytes.data()) {}

  bool record(const tool::TracedRecord& record) override {
    EXPECT_EQ(record.header.data(), shownUpTo_) << record.path;
    EXPECT_EQ(record.header.data() + record.header.size(), record.value.data()) << record.path;
    shownUpTo_ = record.value.data();
    if (record.type != ValueType::message) shownUpTo_ += record.value.size();
    return true;
  }

  const std::byte* shownUpTo() const { return shownUpTo_; }

 private:
  const std::byte* shownUpTo_;
};

void damage(std::string& bytes, Random& random) {
  for (std::size_t count = random.below(4); count > 0 && !bytes.empty(); --count) {
    const std::size_t at = random.below(bytes.size());
    switch (random.below(3)) {
      case 0: bytes[at] = static_cast<char>(random.number()); break;
      case 1: bytes.resize(at); break;
      default: bytes.insert(at, 1, static_cast<char>(random.number()));
    }
  }
}

TEST(Trace, ShowsAllBytesAndFailsAsParsingDoes) {
  Random random;
  const std::size_t rounds = Random::rounds(roundsPerType);
  AllMessages::forEach([&]<class M>() {
    SCOPED_TRACE(M::protoMessageName);
    for (std::size_t round = 0; round < rounds && !HasFailure(); ++round) {
      std::string encoding = randomEncoding(M::protoMessageName, random);
      damage(encoding, random);
      SCOPED_TRACE(toHex(encoding));
      const auto bytes = bytesOf(encoding);
      Seamless sink(bytes);
      const auto traced = tool::trace(tool::typeOf<M>(), bytes, sink);
      const auto parsed = M::parse(encoding);
      ASSERT_EQ(traced.has_value(), parsed.has_value());
      if (traced) {
        EXPECT_EQ(sink.shownUpTo(), bytes.data() + bytes.size());
      } else {
        EXPECT_EQ(traced.error(), parsed.error());
        EXPECT_LE(sink.shownUpTo() - bytes.data(), static_cast<std::ptrdiff_t>(parsed.error().offset));
      }
    }
  });
}

// Path, type, value and what there is to say of it, in a line.
class Lines final : public tool::TraceSink {
 public:
  bool record(const tool::TracedRecord& record) override {
    constexpr std::string_view types[] = {"string", "bytes", "boolean", "uint32", "enumeration", "message"};
    std::string line(record.path);
    line += ' ';
    line += record.type ? types[static_cast<std::size_t>(*record.type)] : "unknown";
    line += ' ' + std::to_string(record.number);
    if (record.field == nullptr) line += " undefined";
    if (record.type == ValueType::enumeration) line += " " + std::string(record.caseName());
    lines_.push_back(line);
    return lines_.size() < 5;
  }
  const std::vector<std::string>& lines() const { return lines_; }

 private:
  std::vector<std::string> lines_;
};

std::vector<std::string> linesOf(const tool::MessageType& type, std::string_view digits) {
  const std::string encoding = hex(digits);
  Lines lines;
  EXPECT_TRUE(tool::trace(type, bytesOf(encoding), lines).has_value());
  return lines.lines();
}

TEST(Trace, TellsPathsKindsAndValues) {
  using Strings = std::vector<std::string>;
  EXPECT_EQ(linesOf(tool::typeOf<Group>(), "0A 0C 12 00 12 08 0A 01 61 10 05 1A 01 62"),
            (Strings{"initialize message 0", "initialize.members[0] message 0",
                     "initialize.members[1] message 0", "initialize.members[1].handle string 0",
                     // A token that is a number.
                     "initialize.members[1].tokenID unknown 5"}));
  EXPECT_EQ(
      linesOf(tool::typeOf<SessionMessage>(), "10 05 10 09 10 FF FF FF FF FF FF FF FF FF 01 25 01 00 00 00"),
      (Strings{"type enumeration 5 groupMessage", "type enumeration 9 ",
               "type enumeration 18446744073709551615 ", "4 unknown 1 undefined"}));
}

TEST(Trace, TakesRepeatedOneofMembersInLinearTime) {
  class Counter final : public tool::TraceSink {
   public:
    bool record(const tool::TracedRecord&) override {
      ++count_;
      return true;
    }
    std::size_t count() const { return count_; }

   private:
    std::size_t count_ = 0;
  } counter;
  const std::string encoding = repeated(hex("0A 02 12 00"), 1'000'000);
  EXPECT_TRUE(tool::trace(tool::typeOf<Group>(), bytesOf(encoding), counter).has_value());
  EXPECT_EQ(counter.count(), 2'000'000U);
}

}  // namespace
}  // namespace orv::test
