// Times everything in the catalogue and writes the samples of every case as JSON, a line each:
//
//   bench_timing <filter> <samples> <milliseconds> <seed> [<peer>...]
//
// The filter is a regular expression for operation/workload/peer. Every case gets so many samples of about so
// many milliseconds, those with very many messages three; each has new objects in other places. They are taken
// in rounds: in each, the rows (operation and workload) come in an order left to chance, and so do the peers of
// a row, one after the other, so that a sample is best compared with those of the same round. They are
// processor time, so that other programs disturb them less.

#include <alloca.h>
#include <malloc.h>

#include <algorithm>
#include <barrier>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <limits>
#include <map>
#include <regex>
#include <string>
#include <thread>
#include <vector>

#include "bench/catalogue.hpp"
#include "bench/placement.hpp"

namespace {

// Of how many parts of a sample the fastest counts.
constexpr int parts = 3;
// More messages than these take long to make, so that fewer samples must do.
constexpr std::size_t veryMany = 10'000;
constexpr std::size_t samplesOfVeryMany = 3;

double threadNanoseconds() {
  timespec time;
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
  return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
}

// Nanoseconds of one iteration, after one that is not timed: it pays for what others left in caches and heap.
// Of a few parts the fastest counts: what comes in between only adds.
[[gnu::noinline]] double timeLoop(const bench::Loop& loop, std::size_t iterations, std::size_t stackShift) {
  volatile char* const shift = static_cast<volatile char*>(alloca(stackShift + 1));
  shift[0] = 0;
  loop(1);
  double fastest = std::numeric_limits<double>::infinity();
  for (int part = 0; part < parts; ++part) {
    const double start = threadNanoseconds();
    loop(iterations);
    fastest = std::min(fastest, threadNanoseconds() - start);
  }
  return fastest / static_cast<double>(iterations);
}

// One sample; the mean of all threads that run it at once.
double sample(const bench::Case& measured, std::size_t iterations) {
  const std::size_t stackShift = bench::placementChance()() % 256 * 16;
  const auto blocks = bench::scatteredBlocks();
  if (measured.threads == 1) return timeLoop(measured.prepare(), iterations, stackShift);
  std::barrier start(measured.threads);
  std::vector<double> times(static_cast<std::size_t>(measured.threads));
  {
    std::vector<std::jthread> threads;
    for (double& time : times) {
      threads.emplace_back([&, loop = measured.prepare()] {
        start.arrive_and_wait();
        time = timeLoop(loop, iterations, stackShift);
      });
    }
  }
  double sum = 0;
  for (const double time : times) sum += time;
  return sum / static_cast<double>(times.size());
}

struct Measurement {
  const bench::Case* measured;
  std::size_t iterations = 1;
  std::vector<double> samples{};
};

// So many iterations for each part as fill the time, and whole turns of all messages; of very many messages one
// turn for all parts together.
std::size_t iterationsFor(const bench::Case& measured, double nanoseconds) {
  if (measured.messages > veryMany) return measured.messages / parts;
  std::size_t iterations = measured.messages;
  double time = sample(measured, iterations);
  if (time * static_cast<double>(iterations) < nanoseconds / 10) {
    iterations = std::max(iterations, static_cast<std::size_t>(nanoseconds / 10 / std::max(time, 1.0)));
    time = sample(measured, iterations);
  }
  const double turns = nanoseconds / time / static_cast<double>(measured.messages);
  return measured.messages * std::max<std::size_t>(1, static_cast<std::size_t>(turns));
}

void takeSamples(std::map<std::string, std::vector<Measurement>>& rows, std::size_t samples,
                 double nanoseconds) {
  std::vector<std::vector<Measurement>*> order;
  for (auto& [name, row] : rows) {
    order.push_back(&row);
    for (Measurement& each : row) each.iterations = iterationsFor(*each.measured, nanoseconds / parts);
  }
  for (std::size_t round = 0; round < samples; ++round) {
    std::ranges::shuffle(order, bench::placementChance());
    for (std::vector<Measurement>* const row : order) {
      if (row->front().measured->messages > veryMany && round >= samplesOfVeryMany) continue;
      std::ranges::shuffle(*row, bench::placementChance());
      for (Measurement& each : *row) each.samples.push_back(sample(*each.measured, each.iterations));
    }
  }
}

void print(const Measurement& of, const char* separator) {
  const bench::Case& measured = *of.measured;
  std::printf(
      "%s{\"operation\": \"%s\", \"workload\": \"%s\", \"set\": \"%s\", \"peer\": \"%s\", \"samples\": [",
      separator, measured.operation.c_str(), measured.workload.c_str(), std::string(measured.set).c_str(),
      std::string(measured.peer).c_str());
  for (std::size_t i = 0; i < of.samples.size(); ++i)
    std::printf("%s%.3f", i == 0 ? "" : ", ", of.samples[i]);
  std::printf("]}");
}

}  // namespace

int main(int argumentCount, char** arguments) {
  if (argumentCount < 5) return 2;
  const std::regex filter(arguments[1]);
  const auto samples = static_cast<std::size_t>(std::atoi(arguments[2]));
  const double nanoseconds = std::atof(arguments[3]) * 1e6;
  bench::placementChance().seed(static_cast<std::uint64_t>(std::atoll(arguments[4])));
  const bench::Catalogue catalogue = bench::allPeers({arguments + 5, arguments + argumentCount});
  // What has been freed stays with the program, as in one that runs for long. Otherwise a list's memory may go
  // back to the kernel and come anew in every iteration, depending on what else the heap's end holds.
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  mallopt(M_MMAP_THRESHOLD, 1 << 30);

  // By the number of threads: as soon as there has been a second one, the heap takes its locks.
  std::map<int, std::map<std::string, std::vector<Measurement>>> rows;
  for (const bench::Case& measured : catalogue.cases) {
    const std::string row = measured.operation + "/" + measured.workload;
    if (!std::regex_search(row + "/" + std::string(measured.peer), filter)) continue;
    rows[measured.threads][row].push_back({&measured});
  }
  for (auto& [threads, rowsOfThreads] : rows) takeSamples(rowsOfThreads, samples, nanoseconds);

  const char* separator = "[\n";
  for (const auto& [threads, rowsOfThreads] : rows) {
    for (const auto& [name, row] : rowsOfThreads) {
      for (const Measurement& each : row) {
        print(each, separator);
        separator = ",\n";
      }
    }
  }
  std::printf("\n]\n");
}
