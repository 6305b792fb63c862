// Random input against the code that protoc generates: the same verdicts, the same bytes, the same text.
#include <gtest/gtest.h>

#include <array>

#include "tests/testing/any_message.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/properties.hpp"
#include "tests/testing/wire_cases.hpp"

namespace orv::test {
namespace {

// Takes both through the same input. `acceptedCount` grows with each input that both accept.
void compare(const AnyMessage& type, const std::string& bytes, std::size_t& acceptedCount) {
  const OfficialVerdict verdict = readBesideOfficial(type, bytes);
  EXPECT_EQ(verdict.fault, "") << type.fullName() << ", input " << toHex(bytes);
  if (verdict.isAccepted) ++acceptedCount;
}

// One change that may or may not leave the bytes well-formed.
std::string mutated(std::string bytes, Random& random) {
  static const std::array<std::string, 16> pieces{hex("00"),
                                                  hex("08"),
                                                  hex("0A"),
                                                  hex("0A 00"),
                                                  hex("12 02"),
                                                  hex("0B"),
                                                  hex("0C"),
                                                  hex("1D"),
                                                  hex("28 01"),
                                                  hex("FF"),
                                                  hex("80"),
                                                  hex("8A 00"),
                                                  hex("FF*9 01"),
                                                  hex("8A 80 80 80 10"),
                                                  hex("8A 80 80 80 80 00"),
                                                  hex("80 80 80 80 08")};
  const std::size_t at = random.below(bytes.size() + 1);
  const std::size_t count = std::min(random.below(8), bytes.size() - at);
  switch (random.below(6)) {
    case 0: return bytes.substr(0, at);
    case 1: return bytes.erase(at, count);
    case 2: return bytes.insert(at, bytes.substr(at, count));
    case 3: return bytes.insert(at, random.pick(pieces));
    case 4: return bytes.replace(at, count, random.pick(pieces));
    default:
      if (at < bytes.size()) bytes[at] = static_cast<char>(bytes[at] ^ (1 << random.below(8)));
      return bytes;
  }
}

TEST(Differential, ReadsAndWritesAsTheOfficialCodeDoes) {
  Random random;
  std::size_t triedCount = 0;
  std::size_t acceptedCount = 0;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(400); round > 0 && !HasFailure(); --round) {
      const std::string valid = randomEncoding(type->fullName(), random);
      compare(*type, valid, acceptedCount);
      compare(*type, valid + randomEncoding(type->fullName(), random), acceptedCount);
      std::string changed = valid;
      for (int change = 0; change < 6; ++change) {
        changed = mutated(changed, random);
        compare(*type, changed, acceptedCount);
        EXPECT_EQ(faultOfReading(*type, changed), "") << type->fullName() << ", input " << toHex(changed);
        EXPECT_EQ(faultOfMerging(*type, valid, changed), "")
            << type->fullName() << ", input " << toHex(changed);
        EXPECT_EQ(faultOfRefusing(*type, changed + valid), "")
            << type->fullName() << ", input " << toHex(changed);
      }
      compare(*type, random.bytes(random.below(12)), acceptedCount);
      triedCount += 9;
    }
    const std::string cut = randomEncoding(type->fullName(), random);
    for (std::size_t size = 0; size < cut.size(); ++size) compare(*type, cut.substr(0, size), acceptedCount);
  }
  std::cout << acceptedCount << " of " << triedCount << " inputs were accepted\n";
  EXPECT_GT(acceptedCount, triedCount / 4);
  EXPECT_LT(acceptedCount, triedCount * 3 / 4);
}

// Two bytes for each type; ORV_TEST_LENGTH says otherwise. Of three there are three hundred million.
TEST(Differential, ReadsEveryShortInputAsTheOfficialCodeDoes) {
  const std::uint64_t longest = Random::fromEnvironment("ORV_TEST_LENGTH", 2);
  std::size_t acceptedCount = 0;
  std::size_t triedCount = 0;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t length = 0; length <= longest; ++length) {
      for (std::uint64_t number = 0; number >> 8 * length == 0; ++number) {
        std::string bytes(length, '\0');
        for (std::size_t at = 0; at < length; ++at) bytes[at] = static_cast<char>(number >> 8 * at);
        compare(*type, bytes, acceptedCount);
        ++triedCount;
      }
      ASSERT_FALSE(HasFailure());
    }
  }
  std::cout << acceptedCount << " of " << triedCount << " inputs were accepted\n";
}

TEST(Differential, AgreesOnWhatIsWrittenByHand) {
  std::size_t acceptedCount = 0;
  for (const ReadCase& row : readCases()) compare(messageNamed(row.message), hex(row.input), acceptedCount);
  EXPECT_EQ(acceptedCount, readCases().size());
  for (const RefusedCase& row : refusedCases())
    compare(messageNamed(row.message), hex(row.input), acceptedCount);
  for (const MalformedCase& row : malformedCases()) {
    for (const MessagePointer& type : allMessages()) compare(*type, hex(row.input), acceptedCount);
  }
}

TEST(Differential, DescribesAsTheOfficialCodeDoes) {
  Random random;
  for (const MessagePointer& type : allMessages()) {
    for (std::size_t round = Random::rounds(1000); round > 0 && !HasFailure(); --round) {
      const auto official = newOfficial(type->fullName());
      fillRandomly(*official, random);
      const std::string bytes = official->SerializeAsString();
      SCOPED_TRACE(std::string(type->fullName()) + ", input " + toHex(bytes));
      EXPECT_EQ(type->parse(bytes).value()->debugDescription(), official->DebugString());
    }
  }
}

TEST(Differential, ShowsUnknownFieldsAsTheOfficialCodeDoes) {
  const auto compareUnknown = [](const std::string& body) {
    const std::string input = record(20, body) + hex("A3 01") + record(3, body) + hex("A4 01");
    const auto official = newOfficial("orv.Member");
    ASSERT_TRUE(official->ParseFromString(input));
    EXPECT_EQ(messageNamed("orv.Member").parse(input).value()->debugDescription(), official->DebugString())
        << toHex(input);
  };
  // Bodies that may or may not be taken for messages.
  std::string nested = hex("08 01");
  std::string groups = hex("08 01");
  for (int level = 0; level < 14; ++level) {
    nested = record(3, nested);
    groups = hex("1B") + groups + hex("1C");
    compareUnknown(nested);
    compareUnknown(groups);
  }
  for (const std::string_view body :
       {"88 00 05", "88 80 80 80 00 05", "88 80*8 00 05", "0A 80 80 80 80 10 08 01", "0A 82 00 08 01",
        "08 FF*9 7F", "0D 01 02 03", "1C", "00", "0E 00"}) {
    compareUnknown(hex(body));
  }
  constexpr std::string_view bytes("\x08\x0A\x0B\x0C\x0D\x09\x00\x01\x02\x04\x80\xFF\x10\x13\x14\x03", 16);
  Random random;
  for (std::size_t round = Random::rounds(20'000); round > 0 && !HasFailure(); --round) {
    std::string body;
    for (std::size_t size = random.below(14); size > 0; --size) body += bytes[random.below(bytes.size())];
    compareUnknown(body);
  }
}

}  // namespace
}  // namespace orv::test
