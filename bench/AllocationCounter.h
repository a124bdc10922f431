#pragma once

// Counts heap allocations in a benchmark program. Include it in exactly one
// source file of the program: it replaces the global allocation functions
// (every form, so that no memory crosses from one allocator to another).
// They are kept out of line: inlined into a caller, g++ pairs the malloc and
// free inside them with the new and delete outside and warns of a mismatch.

#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace wavemill_bench {

inline std::atomic<long long> &allocationCounter() {
  static std::atomic<long long> counter{0};
  return counter;
}

inline void *allocate(std::size_t size) noexcept {
  allocationCounter().fetch_add(1, std::memory_order_relaxed);
  return std::malloc(size == 0 ? 1 : size);
}

// Reports the allocations made while it lives, per iteration, as the
// benchmark counter "allocs".
class AllocationCount {
public:
  explicit AllocationCount(benchmark::State &state) : state(state), start(allocationCounter().load()) {}
  ~AllocationCount() {
    state.counters["allocs"] =
        benchmark::Counter(static_cast<double>(allocationCounter().load() - start), benchmark::Counter::kAvgIterations);
  }

private:
  benchmark::State &state;
  long long start;
};

} // namespace wavemill_bench

__attribute__((noinline)) void *operator new(std::size_t size) {
  if (void *memory = wavemill_bench::allocate(size))
    return memory;
  throw std::bad_alloc();
}
__attribute__((noinline)) void *operator new[](std::size_t size) {
  if (void *memory = wavemill_bench::allocate(size))
    return memory;
  throw std::bad_alloc();
}
__attribute__((noinline)) void *operator new(std::size_t size, const std::nothrow_t &) noexcept {
  return wavemill_bench::allocate(size);
}
__attribute__((noinline)) void *operator new[](std::size_t size, const std::nothrow_t &) noexcept {
  return wavemill_bench::allocate(size);
}
__attribute__((noinline)) void operator delete(void *memory) noexcept { std::free(memory); }
__attribute__((noinline)) void operator delete[](void *memory) noexcept { std::free(memory); }
__attribute__((noinline)) void operator delete(void *memory, std::size_t) noexcept { std::free(memory); }
__attribute__((noinline)) void operator delete[](void *memory, std::size_t) noexcept { std::free(memory); }
__attribute__((noinline)) void operator delete(void *memory, const std::nothrow_t &) noexcept { std::free(memory); }
__attribute__((noinline)) void operator delete[](void *memory, const std::nothrow_t &) noexcept { std::free(memory); }
