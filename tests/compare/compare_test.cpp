// Where messages differ, against the messages' own equality.
#include <orv/compare.hpp>

#include <gtest/gtest.h>

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
template <class M>
std::vector<std::string> differences(std::string_view before, std::string_view after) {
  std::vector<std::string> lines;
  for (const auto& each : compare::differences(M::parse(hex(before)).value(), M::parse(hex(after)).value())) {
    const auto kind = static_cast<std::size_t>(each.kind);
    lines.push_back(std::string("~-+").substr(kind, 1) + ' ' + each.path + ": " + each.before + "|" +
                    each.after);
  }
  return lines;
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
            (Strings{"+ initialize.members[1].handle: |\"a\"", "- initialize.members[2].tokenID: \"\"|"}));
  // Unknown fields, of the same values spelled otherwise, and in another order.
  EXPECT_EQ(differences<Member>("18 01", "18 81 00"), (Strings{"~ unknownFields[0]: 18 01|18 81 00"}));
  EXPECT_EQ(differences<Member>("18 01 20 02", "20 02 18 01"),
            (Strings{"~ unknownFields[0]: 18 01|20 02", "~ unknownFields[1]: 20 02|18 01"}));
  // The payload in its place, in whatever order of fields.
  EXPECT_EQ(
      differences<envelope::Envelope<Group>>("10 05 1A 04 22 02 10 01", "1A 07 22 05 0A 01 FF 10 00 10 05"),
      (Strings{"+ data.memberLeft.groupUUID: |ff", "- data.memberLeft.usesToken: true|"}));
  EXPECT_EQ(differences<envelope::Envelope<Group>>("10 01", "10 09"), (Strings{"~ type: joinRequest|9"}));
  // Long values from where they differ.
  EXPECT_EQ(differences<Member>("0A 64 61*100", "0A 64 61*99 62"),
            (Strings{"~ handle: …\"aaaaaaaaa\" (100 bytes)|…\"aaaaaaaab\" (100 bytes)"}));
}

}  // namespace
}  // namespace orv::test
