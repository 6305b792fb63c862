#include <orv/text.hpp>

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include <orv/byte_buffer.hpp>
#include "runtime/canonical.hpp"
#include "tests/testing/hex.hpp"
#include "tests/testing/normal_form.hpp"
#include "tests/testing/random.hpp"
#include "tests/testing/utf8.hpp"

namespace orv::test {
namespace {

std::uint64_t hashOf(const Text& text) {
  Hasher hasher;
  text.hash(hasher);
  return hasher.finish();
}

TEST(Text, ReplacesEachMaximalIllFormedPart) {
  const std::string fffd = "EF BF BD ";
  const struct {
    const char* name;
    std::string_view given;
    std::string kept;
    std::size_t firstFault;
  } cases[] = {
      {"overlong forms", "C0 AF E0 80 BF F0 81 82 41", repeated(fffd, 8) + "41", 0},
      {"surrogates", "ED A0 80 ED BF BF ED AF 41", repeated(fffd, 8) + "41", 0},
      {"above U+10FFFF", "F4 91 92 93 FF 41 80 BF 42", repeated(fffd, 5) + "41" + repeated(fffd, 2) + "42",
       0},
      {"cut sequences", "E1 80 E2 F0 91 92 F1 BF 41", repeated(fffd, 4) + "41", 0},
      {"cut sequences between letters", "61 F1 80 80 E1 80 C2 62 80 63 80 BF 64",
       "61" + repeated(fffd, 3) + "62" + fffd + "63" + repeated(fffd, 2) + "64", 1},
      {"cut at the end", "61 C3", "61" + fffd, 1},
      {"a cut four-byte sequence at the end", "F0 9F 98", fffd, 0},
      {"C1", "61*7 C1 BF", "61*7" + repeated(fffd, 2), 7},
      {"F5", "61*8 F5 80 80 80", "61*8" + repeated(fffd, 4), 8},
      {"behind well-formed text", "C3 A9 E2 82 AC F0 9F 98 80 FF", "C3 A9 E2 82 AC F0 9F 98 80" + fffd, 9},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    EXPECT_EQ(toHex(Text(hex(row.given)).utf8()), toHex(hex(row.kept)));
    EXPECT_EQ(Text::checked(hex(row.given)), std::unexpected(IllFormedText{row.firstFault}));
    EXPECT_EQ(Text::checked(hex(row.kept)).value().utf8(), hex(row.kept));
  }
}

TEST(Text, KeepsWellFormedBytes) {
  for (const std::string text : {"", "a", "\u00E9", "e\u0301", "\U0010FFFF", "\uFFFF", "\uFFFD", "a\0b"}) {
    EXPECT_EQ(Text(text).utf8(), text);
    EXPECT_EQ(Text::checked(text).value().utf8(), text);
  }
  EXPECT_EQ(Text(std::string_view("a\0b", 3)).sizeInBytes(), 3U);
  EXPECT_TRUE(Text().isEmpty());
}

TEST(Text, EqualsTextsThatAreCanonicallyEquivalent) {
  const struct {
    const char* name;
    const char* left;
    const char* right;
    bool areEqual;
  } cases[] = {
      {"accent", "\u00E9", "e\u0301", true},
      {"accent behind ASCII", "caf\u00E9s", "cafe\u0301s", true},
      {"other accent", "\u00E9", "e\u0300", false},
      {"Kelvin sign", "\u212A", "K", true},
      {"Kelvin sign, other case", "\u212A", "k", false},
      {"Angstrom sign", "\u212B", "A\u030A", true},
      {"marks of different classes in another order", "a\u0301\u0316", "a\u0316\u0301", true},
      {"marks of one class in another order", "a\u0301\u0300", "a\u0300\u0301", false},
      {"a mark across a letter", "a\u0301b\u0316", "a\u0316b\u0301", false},
      {"a joiner between marks keeps their order", "a\u0301\u034F\u0316", "a\u0316\u034F\u0301", false},
      {"marks without a letter", "\u0301\u0316", "\u0316\u0301", true},
      {"the longest decomposition", "\u1F82", "\u03B1\u0313\u0300\u0345", true},
      {"a mark goes between those of one letter", "\u1F82\u0316", "\u03B1\u0316\u0313\u0300\u0345", true},
      {"a mark that decomposes", "a\u0344", "a\u0308\u0301", true},
      {"Hangul", "\uD55C", "\u1112\u1161\u11AB", true},
      {"Hangul without a final consonant", "\uAC00", "\u1100\u1161", true},
      {"what only looks like a final consonant", "\uAC00\u11A7", "\uAC00", false},
      {"what only looks like one, decomposed", "\uAC00\u11A7", "\u1100\u1161\u11A7", true},
      {"what only looks like one, and another", "\uAC00\u11A7", "\uAC01", false},
      {"compatibility is not enough", "\uFB01", "fi", false},
      {"an ideograph of the second plane", "\U0002F800", "\u4E3D", true},
      {"the end is missing", "e\u0301", "e", false},
      {"prefix of a longer accent", "e\u0301\u0316", "\u00E9", false},
      {"nothing", "", "\u0301", false},
      {"an invisible character", "a\u200D", "a", false},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.name);
    for (const std::string around : {"", "x", "\u0301", "\uAC00"}) {
      const Text left = around + row.left, right = around + row.right;
      EXPECT_EQ(left == right, row.areEqual) << around;
      EXPECT_EQ(right == left, row.areEqual) << around;
      EXPECT_EQ(hashOf(left) == hashOf(right), row.areEqual) << around;
      EXPECT_EQ((left <=> right) == 0, row.areEqual) << around;
      EXPECT_EQ(left<right, right> left) << around;
    }
  }
}

// Lines of code points in five columns; c1, c2, c3 are equivalent to each other, c4 to c5.
TEST(Text, PassesTheUnicodeConsortiumsCases) {
  std::ifstream file(ORV_NORMALIZATION_CASES);
  if (!file) GTEST_SKIP() << "the package unicode-data was not there when this was built";
  std::size_t lineCount = 0;
  for (std::string line; std::getline(file, line);) {
    if (line.empty() || line[0] == '#' || line[0] == '@') continue;
    ++lineCount;
    std::array<std::string, 5> columns;
    std::istringstream columnStream(line);
    for (std::string& column : columns) {
      std::string codePoints;
      std::getline(columnStream, codePoints, ';');
      std::istringstream stream(codePoints);
      for (std::uint32_t codePoint; stream >> std::hex >> codePoint;)
        appendUtf8(static_cast<char32_t>(codePoint), column);
    }
    const Text c1 = columns[0], c2 = columns[1], c3 = columns[2], c4 = columns[3], c5 = columns[4];
    EXPECT_TRUE(c1 == c2 && c2 == c3 && c4 == c5) << line;
    EXPECT_TRUE(hashOf(c1) == hashOf(c3) && hashOf(c2) == hashOf(c3) && hashOf(c4) == hashOf(c5)) << line;
    EXPECT_EQ(c3 == c5, columns[2] == columns[4]) << line;
    std::string decomposed;
    for (const char32_t codePoint : canonicalDecomposition(columns[0])) appendUtf8(codePoint, decomposed);
    EXPECT_EQ(decomposed, columns[2]) << line;
  }
  EXPECT_GT(lineCount, 10'000U);
}

TEST(Text, AgreesWithASlowNormalisation) {
  const std::array<std::string, 12> pieces{"a",      "\u0301", "\u0316", "\u0345", "\u0344", "\u00E9",
                                           "\uAC00", "\u11A8", "\u1161", "\u1F82", "\u034F", "\U0001D15E"};
  Random random;
  const auto make = [&] {
    std::string text;
    // Long runs of marks are ordered in another way than short ones.
    for (std::size_t count = random.below(random.oneIn(4) ? 80 : 7); count > 0; --count)
      text += random.pick(pieces);
    return text;
  };
  for (std::size_t round = Random::rounds(20'000); round > 0 && !HasFailure(); --round) {
    const std::string left = make(), right = random.oneIn(2) ? make() : slowDecomposition(left);
    const bool areEqual = slowDecomposition(left) == slowDecomposition(right);
    EXPECT_EQ(Text(left) == Text(right), areEqual) << toHex(left) << " and " << toHex(right);
    EXPECT_EQ(hashOf(left) == hashOf(right), areEqual) << toHex(left) << " and " << toHex(right);
    // UTF-8 is ordered as its code points are.
    EXPECT_EQ(Text(left) <=> Text(right), slowDecomposition(left) <=> slowDecomposition(right))
        << toHex(left) << " and " << toHex(right);
  }
}

TEST(Text, StandsBesideTheOtherStrings) {
  const Text text = u8"zo\u00EB";
  EXPECT_EQ(text, u8"zoe\u0308");
  EXPECT_EQ(text, "zoe\u0308");
  EXPECT_EQ(std::string("zoe\u0308"), text);
  EXPECT_EQ(std::string_view("zo\u00EB"), text);
  EXPECT_TRUE(text != std::string_view("zoe") && text > "zoe" && text < std::string("zof"));
  const std::string_view view = text;
  EXPECT_EQ(view, "zo\u00EB");
  EXPECT_EQ("<" + text + std::string(">"), "<zo\u00EB>");
  EXPECT_TRUE(text.size() == 4 && !text.empty() && Text(std::u8string()).empty());

  // Zero is no text.
  static_assert(!std::constructible_from<Text, std::nullptr_t> && !std::constructible_from<Text, ByteBuffer>);
  constexpr auto takesZero = []<class T>(T*) {
    return requires { T(0); }
    || requires { T{0}; };
  };
  static_assert(!takesZero(static_cast<Text*>(nullptr)));
}

TEST(Text, GrowsByAppendingItself) {
  Text text = "\u00E9";
  for (int round = 0; round < 6; ++round) text.append(text);
  EXPECT_EQ(text.utf8(), repeated("\u00E9", 64));
}

}  // namespace
}  // namespace orv::test
