// Times everything in the catalogue under Google Benchmark, as operation/workload/peer.

#include <benchmark/benchmark.h>

#include <cstdio>

#include "bench/catalogue.hpp"

int main(int argumentCount, char** arguments) {
  benchmark::Initialize(&argumentCount, arguments);
  if (benchmark::ReportUnrecognizedArguments(argumentCount, arguments)) return 1;

  const bench::Catalogue catalogue = bench::allPeers();
  // What the official code logs when it refuses a text is part of refusing, as it ships; nobody need read it.
  if (std::freopen("/dev/null", "w", stderr) == nullptr) return 1;
  for (const bench::Case& measured : catalogue.cases) {
    const std::string name = measured.operation + "/" + measured.workload + "/" + std::string(measured.peer);
    benchmark::RegisterBenchmark(name.c_str(), [&measured](benchmark::State& state) {
      // Pays for what another operation left behind in caches and heap.
      measured.run(1);
      // The loop stands beside the operation, compiled with it; here it is entered once.
      while (state.KeepRunningBatch(state.max_iterations)) {
        measured.run(static_cast<std::size_t>(state.max_iterations));
      }
    });
  }
  benchmark::RunSpecifiedBenchmarks();
}
