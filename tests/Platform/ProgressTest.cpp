#include "MarletFoundation/Platform/Progress.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

namespace MarletFoundation::test {
namespace {

TEST(Progress, ChildrenFillTheUnitsThatTheyWereGiven) {
  const auto root = Progress::make(10);
  {
    const Progress::CurrentScope scope(root, 4);
    EXPECT_EQ(Progress::current(), root);
    const auto child = Progress::make(2);
    const auto stranger = Progress::make(1);
    stranger->setCompletedUnitCount(1);
    EXPECT_EQ(root->fractionCompleted(), 0);
    child->setCompletedUnitCount(1);
    EXPECT_DOUBLE_EQ(root->fractionCompleted(), 0.2);
    {
      const Progress::CurrentScope inner(child, 1);
      Progress::make(5)->setCompletedUnitCount(3);  // and ends, which completes it
    }
    EXPECT_EQ(child->completedUnitCount(), 2);
    EXPECT_EQ(root->completedUnitCount(), 4);
  }
  EXPECT_EQ(Progress::current(), nullptr);
  { const Progress::CurrentScope unused(root, 6); }
  EXPECT_TRUE(root->isFinished());
  root->setCompletedUnitCount(11);
  EXPECT_EQ(root->fractionCompleted(), 1);
}

TEST(Progress, CancellingReachesAllBelow) {
  const auto root = Progress::make(1);
  const Progress::CurrentScope scope(root, 1);
  const auto child = Progress::make(1);
  int calls = 0;
  child->setCancellationHandler([&] { ++calls; });
  root->cancel();
  root->cancel();
  EXPECT_EQ(calls, 1);
  const Progress::CurrentScope inner(child, 1);
  const auto late = Progress::make(1);
  late->setCancellationHandler([&] { ++calls; });
  EXPECT_EQ(calls, 2);
  EXPECT_TRUE(late->isCancelled());
}

TEST(Progress, IsObservedAndAdvancedByManyThreads) {
  const auto root = Progress::make(400);
  std::atomic<int> calls = 0;
  root->setObserver([&](double fraction) {
    EXPECT_LE(fraction, 1);
    ++calls;
  });
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      const Progress::CurrentScope scope(root, 100);
      const auto child = Progress::make(50);
      for (int unit = 1; unit <= 50; ++unit) child->setCompletedUnitCount(unit);
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(calls, 200);
  EXPECT_TRUE(root->isFinished());
}

}  // namespace
}  // namespace MarletFoundation::test
