// Where messages differ, against the messages' own equality.
#include <orv/compare.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include <orv/all_messages.hpp>
#include <orv/envelope.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/official.hpp"
#include "tests/testing/random.hpp"

namespace orv::test {
namespace {

constexpr std::size_t roundsPerType = 1000;

// "~ path: before|after" and so on.
std::vector<std::string> lines(const std::vector<compare::Difference>& differences) {
  std::vector<std::string> list;
  for (const auto& each : differences) {
    const auto kind = static_cast<std::size_t>(each.kind);
    list.push_back(std::string("~-+").substr(kind, 1) + ' ' + each.path + ": " + each.before + "|" +
                   each.after);
  }
  return list;
}

template <class M>
std::vector<std::string> differences(std::string_view before, std::string_view after) {
  return lines(compare::differences(M::parse(hex(before)).value(), M::parse(hex(after)).value()));
}

TEST(Difference, IsFoundWhereMessagesAreUnequal) {
  Random random;
  const std::size_t rounds = Random::rounds(roundsPerType);
  AllMessages::forEach([&]<class M>() {
    SCOPED_TRACE(M::protoMessageName);
    for (std::size_t round = 0; round < rounds && !HasFailure(); ++round) {
      const std::string before = randomEncoding(M::protoMessageName, random);
      // Often the same fields in another order.
      std::string after = random.oneIn(2) ? before : randomEncoding(M::protoMessageName, random);
      if (random.oneIn(3)) after = M::parse(after).value().serialize().value();
      const M left = M::parse(before).value();
      const M right = M::parse(after).value();
      EXPECT_EQ(compare::differences(left, right).empty(), left == right) << toHex(before) << '\n'
                                                                          << toHex(after);
      // Also without the messages' own equality before.
      EXPECT_EQ(compare::differencesOfLeaves(compare::LeafCollector::collect(right),
                                             compare::LeafCollector::collect(left))
                    .empty(),
                left == right)
          << toHex(before) << '\n'
          << toHex(after);
    }
  });
}

TEST(Difference, IsToldByField) {
  using Strings = std::vector<std::string>;
  EXPECT_EQ(differences<Member>("0A 01 61", "0A 01 62 12 00"),
            (Strings{"~ handle: \"a\"|\"b\"", "+ tokenID: |\"\""}));
  // "é" in one code point and in two.
  EXPECT_EQ(differences<Member>("0A 02 C3 A9", "0A 03 65 CC 81"), Strings{});
  // A case of a oneof for another, and a default payload.
  EXPECT_EQ(differences<Group>("12 02 12 00", "22 02 10 01"),
            (Strings{"- memberAdded.member: {}|", "+ memberLeft.usesToken: |true"}));
  EXPECT_EQ(differences<Group>("22 00", ""), (Strings{"- memberLeft: {}|"}));
  EXPECT_EQ(differences<Group>("0A 08 12 00 12 00 12 02 12 00", "0A 07 12 00 12 03 0A 01 61"),
            (Strings{"+ initialize.members[1].handle: |\"a\"", "- initialize.members[2]: {tokenID: \"\"}|"}));
  // A member in between, one that moved, and one that is gone with a list.
  EXPECT_EQ(differences<Group>("0A 0A 12 03 0A 01 61 12 03 0A 01 63",
                               "0A 0F 12 03 0A 01 61 12 03 0A 01 62 12 03 0A 01 63"),
            (Strings{"+ initialize.members[1]: |{handle: \"b\"}"}));
  EXPECT_EQ(
      differences<Group>("0A 0A 12 03 0A 01 61 12 03 0A 01 62", "0A 0A 12 03 0A 01 62 12 03 0A 01 61"),
      (Strings{"- initialize.members[0]: {handle: \"a\"}|", "+ initialize.members[1]: |{handle: \"a\"}"}));
  EXPECT_EQ(differences<Group>("0A 08 0A 01 FF 12 03 0A 01 62", ""),
            (Strings{"- initialize.groupUUID: ff|", "- initialize.members[0]: {handle: \"b\"}|"}));
  // Unknown fields, of the same values spelled otherwise, and in another order.
  EXPECT_EQ(differences<Member>("18 01", "18 81 00"), (Strings{"~ unknownFields[0]: 18 01|18 81 00"}));
  EXPECT_EQ(differences<Member>("18 01 20 02", "20 02 18 01"),
            (Strings{"- unknownFields[0]: 18 01|", "+ unknownFields[1]: |18 01"}));
  // The payload in its place, in whatever order of fields.
  EXPECT_EQ(
      differences<envelope::Envelope<Group>>("10 05 1A 04 22 02 10 01", "1A 07 22 05 0A 01 FF 10 00 10 05"),
      (Strings{"+ data.memberLeft.groupUUID: |ff", "- data.memberLeft.usesToken: true|"}));
  EXPECT_EQ(differences<envelope::Envelope<Group>>("10 01", "10 09"), (Strings{"~ type: joinRequest|9"}));
  // Payloads of different types, whose fields have the same numbers, and one that is left bytes.
  const auto collected = []<class P>(const P& payload) {
    return compare::LeafCollector::collect(envelope::Envelope<P>(payload));
  };
  EXPECT_EQ(lines(compare::differencesOfLeaves(collected(Group::parse(hex("22 02 10 01")).value()),
                                               collected(ConnectionRequest::parse(hex("22 01 61")).value()))),
            (Strings{"~ type: groupMessage|connectionRequest", "~ data: orv.Group|orv.ConnectionRequest",
                     "- data.memberLeft.usesToken: true|", "+ data.userInfo: |\"a\""}));
  const auto closed = SessionMessage::parse(hex("10 05 1A 01 FF")).value();
  EXPECT_EQ(lines(compare::differencesOfLeaves(compare::LeafCollector::collect(closed), collected(Group()))),
            (Strings{"~ data: ff|orv.Group"}));
  // Long values from where they differ.
  EXPECT_EQ(differences<Member>("0A 64 61*100", "0A 64 61*99 62"),
            (Strings{"~ handle: …\"aaaaaaaaa\" (100 bytes)|…\"aaaaaaaab\" (100 bytes)"}));
}

// The length of a longest common subsequence, by the table.
std::size_t commonLength(std::string_view before, std::string_view after) {
  std::vector<std::size_t> row(after.size() + 1);
  for (const char c : before) {
    std::size_t diagonal = 0;
    for (std::size_t at = 0; at < after.size(); ++at) {
      const std::size_t above = row[at + 1];
      row[at + 1] = c == after[at] ? diagonal + 1 : std::max(above, row[at]);
      diagonal = above;
    }
  }
  return row.back();
}

// The pairs as two lines, one over the other; in small letters what is equal. Letters of one case are of one shape.
std::string aligned(std::string_view before, std::string_view after) {
  const auto keys = [](std::string_view letters) {
    std::vector<compare::AlignmentKey> list;
    for (const char c : letters)
      list.push_back({.contents = static_cast<std::uint64_t>(c), .shape = c >= 'a' ? 1U : 0U});
    return list;
  };
  std::string above;
  std::string below;
  for (const auto& pair : compare::align(keys(before), keys(after))) {
    above += pair.before ? before[*pair.before] : '-';
    below += pair.after ? after[*pair.after] : '-';
  }
  return above + ' ' + below;
}

TEST(Alignment, PairsWhatBelongsTogether) {
  EXPECT_EQ(aligned("", ""), " ");
  EXPECT_EQ(aligned("ab", ""), "ab --");
  EXPECT_EQ(aligned("abcd", "acd"), "abcd a-cd");
  EXPECT_EQ(aligned("acd", "abcd"), "a-cd abcd");
  EXPECT_EQ(aligned("aaXa", "aaa"), "aaXa aa-a");
  // What is not equal is paired by shape, then in its order.
  EXPECT_EQ(aligned("aBc", "axBc"), "a-Bc axBc");
  EXPECT_EQ(aligned("aXyb", "azb"), "aXyb a-zb");
  EXPECT_EQ(aligned("aXYb", "azb"), "aXYb az-b");
}

TEST(Alignment, FindsALongestCommonSubsequence) {
  Random random;
  const auto letters = [&] {
    std::string text(random.below(30), 'a');
    for (char& c : text) c = static_cast<char>('a' + random.below(4));
    return text;
  };
  for (std::size_t round = 0; round < Random::rounds(roundsPerType) && !HasFailure(); ++round) {
    const std::string before = letters();
    const std::string after = letters();
    const std::string both = aligned(before, after);
    const std::size_t size = both.size() / 2;
    std::size_t equal = 0;
    for (std::size_t at = 0; at < size; ++at) equal += both[at] == both[size + 1 + at] ? 1 : 0;
    EXPECT_EQ(equal, commonLength(before, after)) << both;
    std::string left = both.substr(0, size);
    std::erase(left, '-');
    std::string right = both.substr(size + 1);
    std::erase(right, '-');
    EXPECT_EQ(left, before);
    EXPECT_EQ(right, after);
  }
}

// More edits than one stretch has.
TEST(Alignment, TakesLongListsThatHaveNothingInCommon) {
  std::vector<compare::AlignmentKey> before(100'000);
  for (std::size_t at = 0; at < before.size(); ++at) before[at] = {at, at};
  auto after = before;
  for (auto& key : std::span(after).first(99'000)) key = {~key.contents, ~key.contents};
  const auto pairs = compare::align(before, after);
  ASSERT_EQ(pairs.size(), before.size());
  for (std::size_t at = 0; at < pairs.size(); ++at) EXPECT_EQ(pairs[at], (compare::AlignedPair{at, at}));
}

TEST(Leaf, IsAtThePathsThatLeadToIt) {
  const auto leaves =
      compare::LeafCollector::collect(Group::parse(hex("0A 0A 12 03 0A 01 61 12 03 0A 01 62")).value());
  ASSERT_EQ(leaves.back().path(), "initialize.members[1].handle");
  for (const char* path : {"initialize", "initialize.members", "initialize.members[1]",
                           "initialize.members.handle", "initialize.members[1].handle"})
    EXPECT_TRUE(leaves.back().isAt(path)) << path;
  for (const char* path : {"", "init", "initialize.", "initialize.members[0]", "initialize.members[1",
                           "members", "initialize[0]", "initialize.members[1].handle.x"})
    EXPECT_FALSE(leaves.back().isAt(path)) << path;
}

}  // namespace
}  // namespace orv::test
