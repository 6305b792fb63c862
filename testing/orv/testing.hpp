// Messages in tests with GoogleTest.
#pragma once

#include <ostream>
#include <utility>

#include <orv/compare.hpp>

namespace orv::inline v0::testing {

// A matcher of messages that are equal to one. Of another it says in which fields it differs:
//
//   Expected: equals orv.Member { handle: "anna@tablet" }
//     Actual: orv.Member { handle: "ben@phone" tokenID: "t1" } (of type orv::Member), which differs in
//   handle: "ben@phone" instead of "anna@tablet"
//   tokenID: "t1" instead of nothing
template <class M>
class Equals {
 public:
  using is_gtest_matcher = void;

  explicit Equals(M expected) : expected_(std::move(expected)) {}

  bool MatchAndExplain(const M& actual, std::ostream* explanation) const {
    const auto differences = compare::differences(expected_, actual);
    if (differences.empty() || explanation == nullptr) return differences.empty();
    *explanation << "which differs in";
    for (const compare::Difference& difference : differences) {
      using Kind = compare::Difference::Kind;
      const bool isMissing = difference.kind == Kind::removed, isNew = difference.kind == Kind::added;
      *explanation << '\n'
                   << difference.path << ": " << (isMissing ? "nothing" : difference.after) << " instead of "
                   << (isNew ? "nothing" : difference.before);
    }
    return false;
  }
  void DescribeTo(std::ostream* out) const { *out << "equals " << expected_; }
  void DescribeNegationTo(std::ostream* out) const { *out << "differs from " << expected_; }

 private:
  M expected_;
};

// EXPECT_THAT(message, orv::testing::equals(expected));
template <class M>
Equals<M> equals(M expected) {
  return Equals<M>(std::move(expected));
}

}  // namespace orv::testing
