// Values that several threads read at once, in a program of its own: what is made on first use is made while they race.
// Only a build with the thread sanitizer can fail here for a race: cmake --preset tsan.
#include <gtest/gtest.h>

#include <barrier>
#include <thread>
#include <tuple>
#include <vector>

#include <orv/orv.hpp>
#include "tests/testing/hex.hpp"
#include "tests/testing/wire_cases.hpp"

namespace orv::test {
namespace {

constexpr int threadCount = 4;

// Runs the work in all threads, which begin at the same moment.
template <class Work>
void race(Work work) {
  std::barrier start(threadCount);
  std::vector<std::thread> threads;  // libc++ 19 has no std::jthread yet
  for (int index = 0; index < threadCount; ++index) {
    threads.emplace_back([&] {
      start.arrive_and_wait();
      work();
    });
  }
  for (std::thread& thread : threads) thread.join();
}

// Whatever a message makes on its first use, if anything: defaults, names, cases.
TEST(Threads, MayBeFirstTogether) {
  race([] {
    Group group;
    EXPECT_TRUE(group.initialize().members().empty() && !group.memberAdded().hasMember());
    EXPECT_TRUE(group.memberRemoved().member().handle().isEmpty() && !group.memberLeft().usesToken());
    EXPECT_TRUE(group.memberAdded().member().tokenID().isEmpty());
    EXPECT_TRUE(ConnectionResponse::Content().approved().invitationData().isEmpty());
    EXPECT_TRUE(JoinResponse::Content().approved().memberHandles().empty());
    EXPECT_TRUE(JoinRequest().publicKey().isEmpty() && ConnectionRequest().displayName().isEmpty());
    EXPECT_EQ(SessionMessage().type(), VessaSessionMessageType::unknown);
    EXPECT_EQ(VessaSessionMessageType::allCases().size(), 6U);
    AllMessages::forEach(
        []<class M>() { EXPECT_EQ(M::_protobuf_nameMap().entries().size(), M::descriptor().fields.size()); });
  });
}

TEST(Threads, MayReadTheSameMessage) {
  AllMessages::forEach([]<class M>() {
    for (const ReadCase& row : readCases()) {
      if (row.message != M::protoMessageName.substr(4)) continue;
      const M shared = M::parse(hex(row.input)).value();
      race([&] {
        M copy = shared;
        EXPECT_EQ(copy, shared);
        EXPECT_EQ(std::as_const(copy).hashValue(), shared.hashValue());
        EXPECT_EQ(toHex(shared.serialize().value()), toHex(hex(row.encodedAgain)));
        EXPECT_EQ(shared.encodedSize(), copy.encodedSize());
        EXPECT_EQ(shared.debugDescription(), copy.debugDescription());
        EXPECT_TRUE(copy.reparse(hex(row.input)));
        EXPECT_EQ(shared, copy);
      });
    }
  });
}

}  // namespace
}  // namespace orv::test
