#include "bench/counting_malloc.hpp"

#include <malloc.h>

#include <algorithm>

// The C library's own functions, under the names that it keeps for those who replace them.
extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);
void* __libc_memalign(std::size_t alignment, std::size_t size);
void __libc_free(void* block);
}

namespace {

// The program that counts has one thread.
constinit bench::HeapCounts counts;

// Counts a block by its usable size: that much of the heap is taken, whatever was asked for.
void* counted(void* block) {
  ++counts.allocations;
  counts.liveBytes += malloc_usable_size(block);
  counts.peakBytes = std::max(counts.peakBytes, counts.liveBytes);
  return block;
}

}  // namespace

extern "C" {
void* malloc(std::size_t size) { return counted(__libc_malloc(size)); }
void* calloc(std::size_t count, std::size_t size) { return counted(__libc_calloc(count, size)); }
void* memalign(std::size_t alignment, std::size_t size) { return counted(__libc_memalign(alignment, size)); }
void* aligned_alloc(std::size_t alignment, std::size_t size) { return memalign(alignment, size); }

void* realloc(void* block, std::size_t size) {
  counts.liveBytes -= malloc_usable_size(block);
  return counted(__libc_realloc(block, size));
}

void free(void* block) {
  counts.liveBytes -= malloc_usable_size(block);
  __libc_free(block);
}
}

namespace bench {

HeapCounts heapCounts() { return counts; }

void resetPeak() { counts.peakBytes = counts.liveBytes; }

}  // namespace bench
