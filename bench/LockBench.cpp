// What a free lock costs beside the standard library's: `DispatchLock::lock` is to cost at most two pairs of
// `std::mutex`, and `ReaderWriterDispatchLock::read` two shared pairs of `std::shared_mutex`. Neither may
// allocate; the counter says how often an iteration did.
#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdlib>
#include <mutex>
#include <new>
#include <shared_mutex>

#include "MarletFoundation/Utils/Locks.h"

namespace {

std::atomic<long> allocationCount{0};

}  // namespace

[[gnu::noinline]] void* operator new(std::size_t size) {
  allocationCount.fetch_add(1, std::memory_order_relaxed);
  if (void* memory = std::malloc(size)) return memory;
  throw std::bad_alloc();
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

namespace MarletFoundation {
namespace {

template <class Operation>
void measure(benchmark::State& state, Operation operation) {
  long value = 0;
  const long before = allocationCount;
  for (auto _ : state) {
    operation(value);
    benchmark::DoNotOptimize(value);
  }
  state.counters["allocations"] =
      benchmark::Counter(static_cast<double>(allocationCount - before), benchmark::Counter::kAvgIterations);
}

void twoMutexPairs(benchmark::State& state) {
  std::mutex mutex;
  measure(state, [&](long& value) {
    { const std::lock_guard lock(mutex); }
    const std::lock_guard lock(mutex);
    ++value;
  });
}

void dispatchLock(benchmark::State& state) {
  const DispatchLock lock("bench");
  measure(state, [&](long& value) { lock.lock([&] { ++value; }); });
}

void dispatchLockWithResult(benchmark::State& state) {
  const DispatchLock lock("bench");
  measure(state, [&](long& value) { value = lock.lock([&] { return value + 1; }); });
}

void recursiveDispatchLock(benchmark::State& state) {
  const RecursiveDispatchLock lock("bench");
  measure(state, [&](long& value) { lock.lock([&] { ++value; }); });
}

void twoSharedPairs(benchmark::State& state) {
  std::shared_mutex mutex;
  measure(state, [&](long& value) {
    { const std::shared_lock lock(mutex); }
    const std::shared_lock lock(mutex);
    ++value;
  });
}

void readerWriterRead(benchmark::State& state) {
  const ReaderWriterDispatchLock lock("bench");
  measure(state, [&](long& value) { lock.read([&] { ++value; }); });
}

void readerWriterWrite(benchmark::State& state) {
  const ReaderWriterDispatchLock lock("bench");
  measure(state, [&](long& value) { lock.write([&] { ++value; }); });
}

BENCHMARK(twoMutexPairs);
BENCHMARK(dispatchLock);
BENCHMARK(dispatchLockWithResult);
BENCHMARK(recursiveDispatchLock);
BENCHMARK(twoSharedPairs);
BENCHMARK(readerWriterRead);
BENCHMARK(readerWriterWrite);

/// The whole way of a block through a thread of the pool, a thousand at a time.
void asynchronousBlock(benchmark::State& state) {
  const DispatchLock lock("bench");
  long value = 0;
  while (state.KeepRunningBatch(1000)) {
    for (int i = 0; i < 1000; ++i) lock.asyncLock([&] { ++value; });
    lock.lock([] {});
  }
  benchmark::DoNotOptimize(value);
}
BENCHMARK(asynchronousBlock)->UseRealTime();

/// Threads that all want one lock.
void contended(benchmark::State& state) {
  static const DispatchLock lock("contended");
  static long value = 0;
  for (auto _ : state) lock.lock([] { ++value; });
}
void contendedMutex(benchmark::State& state) {
  static std::mutex mutex;
  static long value = 0;
  for (auto _ : state) {
    const std::lock_guard lock(mutex);
    ++value;
  }
}
BENCHMARK(contendedMutex)->Threads(4)->UseRealTime();
BENCHMARK(contended)->Threads(4)->UseRealTime();

}  // namespace
}  // namespace MarletFoundation

BENCHMARK_MAIN();
