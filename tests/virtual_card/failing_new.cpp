// Replaces operator new for the whole program, the virtual card included.
#include "failing_new.h"

#include <cstdlib>
#include <new>

std::atomic<long> allocations_left{-1};

[[gnu::noinline]] void *operator new(std::size_t size) {
  if (allocations_left.load(std::memory_order_relaxed) >= 0 && allocations_left-- == 0)
    throw std::bad_alloc();
  if (void *memory = std::malloc(size)) return memory;
  throw std::bad_alloc();
}
void *operator new(std::size_t size, const std::nothrow_t &) noexcept {
  return std::malloc(size);
}
[[gnu::noinline]] void operator delete(void *memory) noexcept {
  std::free(memory);
}
void operator delete(void *memory, std::size_t) noexcept {
  ::operator delete(memory);
}
