// What the tests' process takes from the heap through operator new.
#pragma once

#include <cstddef>

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

}  // namespace orv::test
