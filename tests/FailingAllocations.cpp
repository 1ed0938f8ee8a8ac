#include "tests/FailingAllocations.h"

#include <atomic>
#include <cstdlib>
#include <new>

// Allocations up to the one that fails, 0 after it; -1: none is to fail.
static std::atomic<int> left = -1;

bool failAllocation(int nth, const std::function<void()>& work) {
  left = nth;
  try {
    work();
  } catch (const std::bad_alloc&) {
  }
  return left.exchange(-1) == 0;
}

void* operator new(std::size_t size) {
  int before = left;
  while (before > 0 && !left.compare_exchange_weak(before, before - 1)) {
  }
  void* const memory = before == 1 ? nullptr : std::malloc(size > 0 ? size : 1);
  if (!memory) throw std::bad_alloc();
  return memory;
}

void operator delete(void* memory) noexcept { std::free(memory); }
void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }
