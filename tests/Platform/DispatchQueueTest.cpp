#include "MarletFoundation/Platform/DispatchQueue.h"

#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <chrono>
#include <functional>
#include <latch>
#include <memory>
#include <stdexcept>
#include <thread>
#include <vector>

#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

using Kind = DispatchQueue::Kind;
using namespace std::chrono_literals;

/// Something to wait for, with a bound that turns a hang into a failure.
class Event {
 public:
  void set() { isSet_ = true; }
  bool isSet() const { return isSet_; }
  bool wait() const {
    const auto deadline = std::chrono::steady_clock::now() + 5s;
    while (!isSet_ && std::chrono::steady_clock::now() < deadline) std::this_thread::sleep_for(200us);
    return isSet_;
  }

 private:
  std::atomic<bool> isSet_{false};
};

void flush(const DispatchQueue& queue) {
  queue.syncBarrier([] {});
}

TEST(DispatchQueue, SyncRunsOnTheCallersThreadAndGivesBackWhatTheBlockGives) {
  for (const auto& queue : {DispatchQueue("serial"), DispatchQueue("concurrent", Kind::concurrent),
                            DispatchQueue::global(DispatchQuality::utility)}) {
    EXPECT_EQ(queue.sync([] { return std::this_thread::get_id(); }), std::this_thread::get_id());
    EXPECT_EQ(*queue.syncBarrier([] { return std::make_unique<int>(7); }), 7);
    int value = 1;
    queue.sync([&]() -> int& { return value; }) = 2;
    EXPECT_EQ(value, 2);
    EXPECT_THROW(queue.sync([]() -> int { throw std::out_of_range("x"); }), std::out_of_range);
    EXPECT_THROW(queue.syncBarrier([] { throw std::out_of_range("x"); }), std::out_of_range);
    EXPECT_EQ(queue.sync([] { return 3; }), 3) << "after an exception";
  }
}

TEST(DispatchQueue, SerialKeepsTheOrderOfEachSubmitter) {
  const DispatchQueue queue("order");
  std::vector<int> seen;
  int expected = 0;
  for (int i = 0; i < 2000; ++i) {
    const auto note = [&seen, number = expected++] { seen.push_back(number); };
    if (i % 7 == 0)
      queue.sync(note);
    else
      queue.async(note);
  }
  flush(queue);
  ASSERT_EQ(seen.size(), 2000u);
  EXPECT_TRUE(std::is_sorted(seen.begin(), seen.end()));
}

TEST(DispatchQueue, ConcurrentBlocksOverlapAndABarrierHoldsBackWhatComesLater) {
  const DispatchQueue queue("overlap", Kind::concurrent);
  // More readers than the pool has threads at first, each waiting for all.
  constexpr int readers = 12;
  std::latch meeting(readers);
  std::atomic<int> before{0};
  Event barrierRan;
  Event readerGo;
  for (int i = 0; i < readers; ++i)
    queue.async([&] {
      meeting.arrive_and_wait();
      ++before;
    });
  queue.async([&] { readerGo.wait(); });
  queue.asyncBarrier([&] {
    EXPECT_EQ(before, readers);
    barrierRan.set();
  });
  std::thread later([&] {
    // A plain synchronous read would fit beside the reader that runs, but the barrier was first.
    queue.sync([&] { EXPECT_TRUE(barrierRan.isSet()); });
  });
  std::this_thread::sleep_for(20ms);
  EXPECT_FALSE(barrierRan.isSet());
  readerGo.set();
  later.join();
}

TEST(DispatchQueue, DelayedBlocksRunByTimeAndNotEarly) {
  const DispatchQueue queue("delayed");
  const auto start = std::chrono::steady_clock::now();
  std::vector<int> order;
  Event last;
  queue.asyncAfter(0.06, [&] {
    order.push_back(3);
    EXPECT_GE(std::chrono::steady_clock::now() - start, 60ms);
    last.set();
  });
  queue.asyncAfter(0.02, [&] { order.push_back(2); });
  queue.asyncAfter(-1, [&] { order.push_back(1); });
  queue.asyncAfter(1e300, [&] { order.push_back(4); });
  ASSERT_TRUE(last.wait());
  flush(queue);
  EXPECT_EQ(order, (std::vector{1, 2, 3}));
}

TEST(DispatchQueue, MainQueueRunsOnThePumpingThread) {
  const auto main = DispatchQueue::main();
  const auto mainThread = std::this_thread::get_id();
  bool asyncRan = false;
  std::atomic<int> result{0};
  std::thread other([&] {
    main.async([&] { asyncRan = std::this_thread::get_id() == mainThread; });
    EXPECT_THROW(main.sync([] { throw std::logic_error("x"); }), std::logic_error);
    result = main.sync([&] { return asyncRan && std::this_thread::get_id() == mainThread ? 7 : -1; });
  });
  EXPECT_TRUE(runUntil([&] { return result != 0; }, 5));
  other.join();
  EXPECT_EQ(result, 7);

  EXPECT_FALSE(runUntil([] { return false; }, 0.01));
  main.async([] { throw std::logic_error("oops"); });
  EXPECT_EQ(fatalMessage([] { runUntil([] { return false; }, 1); }),
            "an asynchronous block ended in an error: oops");
  bool usable = false;
  main.asyncAfter(0.001, [&] { usable = true; });
  EXPECT_TRUE(runUntil([&] { return usable; }, 5));
}

TEST(DispatchQueue, ValuesFollowTheTargetOfTheInnermostQueue) {
  static const DispatchSpecificKey<int> key;
  static const DispatchSpecificKey<std::string> otherKey;
  const auto background = DispatchQueue::global(DispatchQuality::background);
  const DispatchQueue queue("values", Kind::serial, DispatchQuality::background), plain("plain");
  const auto current = [] { return DispatchQueue::currentSpecific(key); };

  background.setSpecific(key, 1);
  EXPECT_EQ(current(), std::nullopt) << "outside of blocks";
  EXPECT_EQ(queue.getSpecific(key), std::nullopt) << "a queue's own value only";
  EXPECT_EQ(queue.sync(current), 1);
  queue.setSpecific(key, 2);
  EXPECT_EQ(queue.sync(current), 2);
  EXPECT_EQ(queue.sync([&] { return plain.sync(current); }), std::nullopt);
  EXPECT_EQ(queue.sync([&] {
    plain.sync([] {});
    return current();
  }),
            2);
  EXPECT_EQ(queue.sync([] { return DispatchQueue::currentSpecific(otherKey); }), std::nullopt);
  Event done;
  queue.async([&] {
    EXPECT_EQ(current(), 2);
    done.set();
  });
  EXPECT_TRUE(done.wait());
  queue.setSpecific(key, std::nullopt);
  EXPECT_EQ(queue.sync(current), 1);
  background.setSpecific(key, std::nullopt);
}

TEST(DispatchQueue, PoolThreadsThatAllWaitForQueuesDontStarveTheirBlocks) {
  constexpr int jobs = 300;
  std::atomic<int> right{0};
  Event done;
  for (int i = 0; i < jobs; ++i) {
    DispatchQueue::global().async([&, i] {
      const DispatchQueue queue("own", i % 2 ? Kind::serial : Kind::concurrent);
      int value = 0;
      for (int k = 0; k < 3; ++k) queue.asyncBarrier([&] { ++value; });
      if (queue.sync([&] { return value; }) == 3 && ++right == jobs) done.set();
    });
  }
  EXPECT_TRUE(done.wait());
}

TEST(DispatchQueue, AWholePoolAsleepBehindAQueueWakesForItsBlocks) {
  constexpr int jobs = 100;
  const DispatchQueue queue("busy");
  std::atomic<int> started{0}, finished{0};
  bool ran = false;
  Event done;
  queue.sync([&] {
    queue.async([&] { ran = true; });
    for (int i = 0; i < jobs; ++i) {
      DispatchQueue::global().async([&] {
        ++started;
        queue.sync([&] { EXPECT_TRUE(ran); });
        if (++finished == jobs) done.set();
      });
    }
    for (int before = -1; before != started; std::this_thread::sleep_for(50ms)) before = started;
  });
  EXPECT_TRUE(done.wait());
}

TEST(DispatchQueue, AQueueOutlivesItsHandlesWhileItHasWork) {
  Event release, ran;
  {
    const DispatchQueue queue("short-lived");
    queue.async([&] { release.wait(); });
    queue.async([&] { ran.set(); });
  }
  release.set();
  EXPECT_TRUE(ran.wait());
}

TEST(DispatchQueueDeathTest, AnErrorThatLeavesAnAsynchronousBlockEndsTheProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_DEATH(
      {
        DispatchQueue("q").async([] { throw std::runtime_error("lost"); });
        std::this_thread::sleep_for(5s);
      },
      "fatal error: an asynchronous block ended in an error: lost");
}

/// Plain variables that only the queues protect: a fault in handing on shows as a wrong sum, or to a thread
/// sanitizer.
TEST(DispatchQueue, Stress) {
  const DispatchQueue serial("stress serial"), shared("stress concurrent", Kind::concurrent);
  constexpr int threads = 6, rounds = 9 * 160;
  long serialCount = 0, sharedCount = 0;
  std::atomic<int> inside{0}, delayed{0};
  std::atomic<bool> broken{false};
  const auto read = [&] {
    ++inside;
    [[maybe_unused]] const volatile long seen = sharedCount;
    --inside;
  };
  const auto write = [&] {
    if (inside != 0) broken = true;
    ++sharedCount;
  };
  const auto count = [&] { ++serialCount; };
  const std::array<std::function<void(int)>, 9> steps{
      [&](int) { serial.async(count); },
      [&](int) { serial.sync(count); },
      [&](int) { shared.sync(read); },
      [&](int) { shared.async(read); },
      [&](int) { shared.asyncBarrier(write); },
      [&](int) { shared.syncBarrier(write); },
      [&](int) { serial.sync([&] { shared.sync(read), ++serialCount; }); },
      [&](int) { serial.async([&] { shared.syncBarrier(write), ++serialCount; }); },
      [&](int i) { serial.asyncAfter(0.0001 * (i % 10), [&] { ++serialCount, ++delayed; }); },
  };
  std::vector<std::thread> all;
  for (int t = 0; t < threads; ++t) {
    all.emplace_back([&, t] {
      for (int i = 0; i < rounds; ++i) steps[static_cast<std::size_t>(i * 7 + t) % steps.size()](i);
    });
  }
  for (auto& thread : all) thread.join();
  constexpr int ofEach = threads * rounds / 9;
  const auto deadline = std::chrono::steady_clock::now() + 5s;
  while (delayed < ofEach && std::chrono::steady_clock::now() < deadline) std::this_thread::sleep_for(1ms);
  flush(shared);
  EXPECT_EQ(serial.sync([&] { return serialCount; }), 5 * ofEach);
  EXPECT_EQ(shared.syncBarrier([&] { return sharedCount; }), 3 * ofEach);
  EXPECT_FALSE(broken);
}

}  // namespace
}  // namespace MarletFoundation::test
