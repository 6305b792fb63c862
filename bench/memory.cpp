// Writes as JSON what each peer takes of the heap to hold each workload decoded.

#include <cstdio>

#include "bench/catalogue.hpp"
#include "bench/counting_malloc.hpp"

int main() {
  const bench::Catalogue catalogue = bench::allPeers();
  const char* separator = "[\n";
  for (const bench::Holding& holding : catalogue.holdings) {
    bench::HeapCounts before;
    bench::HeapCounts held;
    const std::function<void()> whileHeld = [&] { held = bench::heapCounts(); };
    // The first time pays for what is built on first use.
    for (int round = 0; round < 2; ++round) {
      bench::resetPeak();
      before = bench::heapCounts();
      holding.run(whileHeld);
    }
    std::printf(
        "%s{\"peer\": \"%.*s\", \"workload\": \"%s\", \"members\": %zu, \"sizeof\": %zu, "
        "\"allocations\": %zu, \"heap\": %zu, \"peak\": %zu}",
        separator, static_cast<int>(holding.peer.size()), holding.peer.data(), holding.workload.c_str(),
        holding.members, holding.sizeOf, held.allocations - before.allocations,
        held.liveBytes - before.liveBytes, held.peakBytes - before.liveBytes);
    separator = ",\n";
  }
  std::printf("\n]\n");
}
