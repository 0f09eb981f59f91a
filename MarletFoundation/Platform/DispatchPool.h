#pragma once

#include <array>
#include <condition_variable>
#include <deque>
#include <mutex>

#include "MarletFoundation/Platform/DispatchQueue.h"

namespace MarletFoundation {

inline constexpr std::size_t dispatchQualityCount = 5;

/// The threads behind the global queues. A thread is started when work finds none idle, up to about one a
/// core. When all are stuck in their work, one more is started every few milliseconds, up to a limit, and
/// ends again once there is nothing left to do. The pool is never destroyed; its threads end with the
/// process.
class DispatchPool {
 public:
  static DispatchPool& shared();
  static bool isPoolThread();

  /// Runs `work` on a thread of the pool, before all work of lower quality that no thread has begun.
  void submit(DispatchQuality quality, std::function<void()> work);

 private:
  DispatchPool();

  void work() noexcept;
  std::function<void()> takeNext();
  void startThread();
  void watchForStall();

  const std::size_t usualThreads_;
  std::mutex mutex_;
  std::condition_variable wake_;
  std::array<std::deque<std::function<void()>>, dispatchQualityCount> pending_;
  std::size_t pendingCount_ = 0;
  /// How many pieces of work were ever begun.
  std::uint64_t begun_ = 0;
  std::size_t threads_ = 0;
  std::size_t idle_ = 0;
  bool watching_ = false;
};

}  // namespace MarletFoundation
