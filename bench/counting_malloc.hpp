#pragma once

#include <cstddef>

namespace bench {

// What has been asked of the heap since the program began. Programs that link counting_malloc.cpp count every
// allocation of every language and library in them.
struct HeapCounts {
  std::size_t allocations = 0;
  std::size_t liveBytes = 0;
  std::size_t peakBytes = 0;
};

HeapCounts heapCounts();

// Lets the peak start anew from what is live now.
void resetPeak();

}  // namespace bench
