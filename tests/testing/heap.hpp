// What the tests' process takes from the heap through operator new.
#pragma once

#include <cstddef>
#include <new>
#include <stdexcept>

namespace orv::test {

struct HeapCounts {
  std::size_t allocations = 0;
  std::size_t totalBytes = 0;  // of all allocations, freed or not
  std::size_t liveBytes = 0;
  std::size_t peakBytes = 0;  // the most that were live
};

HeapCounts heapCounts();

// Counts from where it was made.
class HeapMeter {
 public:
  HeapMeter();
  std::size_t allocations() const { return heapCounts().allocations - start_.allocations; }
  std::size_t totalBytes() const { return heapCounts().totalBytes - start_.totalBytes; }
  std::size_t liveBytes() const { return heapCounts().liveBytes - start_.liveBytes; }
  // By how much more was live at some moment than at the start.
  std::size_t peakBytes() const { return heapCounts().peakBytes - start_.liveBytes; }

 private:
  HeapCounts start_;
};

// As long as it lives, this thread's operator new gives so many blocks and then throws std::bad_alloc.
class HeapShortage {
 public:
  explicit HeapShortage(std::size_t allocations);
  HeapShortage(const HeapShortage&) = delete;
  HeapShortage& operator=(const HeapShortage&) = delete;
  ~HeapShortage();
};

// Calls `act` on a new value of `make` while memory runs out at its first allocation, at its second and so on,
// until it ends without running out; `check` then looks at the value that it failed on, and what act, check and
// the value's destruction leave behind is counted as a leak. Answers how often memory ran out.
template <class Make, class Act, class Check>
std::size_t runOutOfMemory(Make make, Act act, Check check) {
  for (std::size_t allocations = 0;; ++allocations) {
    const HeapMeter meter;
    bool hasFailed = false;
    {
      auto value = make();
      try {
        const HeapShortage shortage(allocations);
        act(value);
      } catch (const std::bad_alloc&) {
        hasFailed = true;
      }
      if (hasFailed) check(value);
    }
    if (meter.liveBytes() != 0) throw std::logic_error("allocations are leaked");
    if (!hasFailed) return allocations;
  }
}

}  // namespace orv::test
