#include "MarletFoundation/Utils/Locks.h"

#include <gtest/gtest.h>

#include <chrono>
#include <latch>
#include <thread>
#include <vector>

namespace MarletFoundation::test {
namespace {

TEST(DispatchLock, CopiesShareOneQueueInOrderOfArrival) {
  const DispatchLock lock("shared");
  const auto copy = lock;
  EXPECT_EQ(lock.queue().label(), "shared");
  std::vector<int> order;
  lock.lock([&] {
    copy.asyncLock([&] { order.push_back(2); });
    lock.asyncLock([&] { order.push_back(3); });
    order.push_back(1);
  });
  EXPECT_EQ(copy.lock([&] { return order; }), (std::vector{1, 2, 3}));
}

TEST(RecursiveDispatchLock, NestsInSynchronousAndAsynchronousBlocks) {
  const RecursiveDispatchLock lock("recursive"), other("other");
  const auto nested = [&] { return lock.lock([&] { return lock.lock([] { return 7; }); }); };
  EXPECT_EQ(nested(), 7);
  EXPECT_EQ(other.lock(nested), 7);
  EXPECT_THROW(lock.lock([&] { lock.lock([] { throw 1; }); }), int);

  bool during = true;
  lock.lock([&] {
    lock.asyncLock([&] {
      during = false;
      EXPECT_EQ(nested(), 7);
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    EXPECT_TRUE(during) << "asyncLock queues, also inside the lock";
  });
  lock.lock([] {});
  EXPECT_FALSE(during);
}

TEST(RecursiveDispatchLock, ExcludesOtherThreads) {
  const RecursiveDispatchLock lock("exclusion");
  long count = 0;
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t)
    threads.emplace_back([&] {
      for (int i = 0; i < 2000; ++i) lock.lock([&] { lock.lock([&] { ++count; }); });
    });
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(count, 8000);
}

TEST(ReaderWriterDispatchLock, ReadersMeetAndWritersDont) {
  const ReaderWriterDispatchLock lock("readers");
  std::latch meeting(3);
  std::thread second([&] { lock.read([&] { meeting.arrive_and_wait(); }); });
  lock.asyncRead([&] { meeting.arrive_and_wait(); });
  EXPECT_EQ(lock.read([&] {
    meeting.arrive_and_wait();
    return 1;
  }),
            1);
  second.join();
  lock.write([] {});

  int value = 0;
  lock.asyncWrite([&] { value = 1; });
  EXPECT_EQ(lock.read([&] { return value; }), 1);
  EXPECT_EQ(lock.write([&] { return ++value; }), 2);
}

}  // namespace
}  // namespace MarletFoundation::test
