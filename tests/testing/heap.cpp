#include "tests/testing/heap.hpp"

#include <malloc.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <new>

namespace {

constinit thread_local orv::test::HeapCounts counts;
constinit thread_local std::size_t allocationsLeft = SIZE_MAX;

void forget(void* block) {
  counts.liveBytes -= std::min(counts.liveBytes, malloc_usable_size(block));
  std::free(block);
}

}  // namespace

void* operator new(std::size_t size) {
  if (allocationsLeft == 0) throw std::bad_alloc();
  if (allocationsLeft != SIZE_MAX) --allocationsLeft;
  void* const block = std::malloc(size);
  if (block == nullptr) std::abort();
  const std::size_t taken = malloc_usable_size(block);
  ++counts.allocations;
  counts.totalBytes += taken;
  counts.liveBytes += taken;
  counts.peakBytes = std::max(counts.peakBytes, counts.liveBytes);
  return block;
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return allocationsLeft == 0 ? nullptr : operator new(size);
}
// Those for arrays do the same by themselves, but where a sanitizer brings its own.
void* operator new[](std::size_t size) { return operator new(size); }
void operator delete(void* block) noexcept { forget(block); }
void operator delete(void* block, std::size_t) noexcept { forget(block); }
void operator delete(void* block, const std::nothrow_t&) noexcept { forget(block); }
void operator delete[](void* block) noexcept { forget(block); }
void operator delete[](void* block, std::size_t) noexcept { forget(block); }

namespace orv::test {

HeapCounts heapCounts() { return counts; }

HeapMeter::HeapMeter() {
  counts.peakBytes = counts.liveBytes;
  start_ = counts;
}

HeapShortage::HeapShortage(std::size_t allocations) { allocationsLeft = allocations; }
HeapShortage::~HeapShortage() { allocationsLeft = SIZE_MAX; }

}  // namespace orv::test
