// Runs every operation of our own library under callgrind, which writes one file for each: how many
// instructions `repetitions` runs of it take.

#include <string>

#include <valgrind/callgrind.h>

#include "bench/catalogue.hpp"

int main() {
  // Enough that a cost which comes only now and then shows, few enough that the run takes seconds.
  constexpr std::size_t repetitions = 8;
  bench::Catalogue catalogue;
  bench::addPeer<bench::Orv>(catalogue);
  for (const bench::Case& measured : catalogue.cases) {
    if (measured.operation == "per-member") continue;
    const std::string name = measured.operation + "/" + measured.workload;
    // The first run builds what is built on first use and is not counted.
    measured.run(1);
    CALLGRIND_START_INSTRUMENTATION;
    CALLGRIND_ZERO_STATS;
    measured.run(repetitions);
    CALLGRIND_DUMP_STATS_AT(name.c_str());
    CALLGRIND_STOP_INSTRUMENTATION;
  }
}
