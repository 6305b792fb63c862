// Runs every operation of our own library under callgrind, which writes one file for each: how many
// instructions `repetitions` runs of it take, with all messages where a workload has many.

#include <string>

#include <valgrind/callgrind.h>

#include "bench/catalogue.hpp"

int main() {
  // Enough that a cost which comes only now and then shows, few enough that the run takes seconds.
  constexpr std::size_t repetitions = 8;
  const bench::Catalogue catalogue = bench::allPeers({"orv"});
  for (const bench::Case& measured : catalogue.cases) {
    // A thousand messages do for many, and two threads count what one does.
    if (measured.set == "scaling" || measured.messages > 1'000 || measured.threads != 1) continue;
    const std::string name = measured.operation + "/" + measured.workload;
    const bench::Loop run = measured.prepare();
    // The first run builds what is built on first use and is not counted.
    run(measured.messages);
    CALLGRIND_START_INSTRUMENTATION;
    CALLGRIND_ZERO_STATS;
    run(repetitions * measured.messages);
    CALLGRIND_DUMP_STATS_AT(name.c_str());
    CALLGRIND_STOP_INSTRUMENTATION;
  }
}
