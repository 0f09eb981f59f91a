#pragma once

#include <condition_variable>
#include <deque>

#include "MarletFoundation/Platform/DispatchQueueCore.h"
#include "MarletFoundation/Platform/DispatchTimer.h"

namespace MarletFoundation {

/// The queue whose blocks wait for the main thread to pump them.
class MainQueue final : public DispatchQueueCore {
 public:
  MainQueue() : DispatchQueueCore("main queue", nullptr) {}

  /// It lives as long as the process.
  static const std::shared_ptr<MainQueue>& shared();

  void sync(BlockReference block, bool barrier) override;
  void async(std::function<void()> block, bool barrier) override;
  bool pumpUntil(const std::function<bool()>& predicate, DispatchTimer::Clock::time_point deadline);

 private:
  std::mutex mutex_;
  std::condition_variable arrived_;
  std::condition_variable finished_;
  std::deque<std::function<void()>> blocks_;
};

}  // namespace MarletFoundation
