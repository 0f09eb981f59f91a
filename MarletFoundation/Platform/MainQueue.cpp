#include "MarletFoundation/Platform/MainQueue.h"

#include <algorithm>
#include <exception>

namespace MarletFoundation {
namespace {

/// How often a predicate is tested that nothing else tells of.
constexpr std::chrono::milliseconds pollInterval{10};

}  // namespace

const std::shared_ptr<MainQueue>& MainQueue::shared() {
  static const auto& queue = *new auto(std::make_shared<MainQueue>());
  return queue;
}

void MainQueue::sync(BlockReference block, bool) {
  bool done = false;
  std::exception_ptr thrown;
  std::unique_lock lock(mutex_);
  blocks_.push_back([&] {
    try {
      block();
    } catch (...) {
      thrown = std::current_exception();
    }
    const std::lock_guard finishing(mutex_);
    done = true;
    finished_.notify_all();
  });
  arrived_.notify_one();
  finished_.wait(lock, [&] { return done; });
  if (thrown) std::rethrow_exception(thrown);
}

void MainQueue::async(std::function<void()> block, bool) {
  const std::lock_guard lock(mutex_);
  blocks_.push_back(std::move(block));
  arrived_.notify_one();
}

bool MainQueue::pumpUntil(const std::function<bool()>& predicate, DispatchTimer::Clock::time_point deadline) {
  while (!predicate()) {
    const auto now = DispatchTimer::Clock::now();
    if (now >= deadline) return false;
    std::unique_lock lock(mutex_);
    if (blocks_.empty()) {
      arrived_.wait_until(lock, std::min(deadline, now + pollInterval));
      continue;
    }
    auto block = std::move(blocks_.front());
    blocks_.pop_front();
    lock.unlock();
    const Entered entered(*this);
    runToEnd(block);
  }
  return true;
}

}  // namespace MarletFoundation
