#include "MarletFoundation/Platform/DispatchTimer.h"

#include <algorithm>
#include <thread>

namespace MarletFoundation {

DispatchTimer& DispatchTimer::shared() {
  static auto& timer = *new DispatchTimer;
  return timer;
}

DispatchTimer::Clock::time_point DispatchTimer::after(double seconds) {
  constexpr double mostSeconds = 1e9;
  // Not a number is no positive number either.
  const std::chrono::duration<double> delay(seconds > 0 ? std::min(seconds, mostSeconds) : 0);
  return Clock::now() + std::chrono::ceil<Clock::duration>(delay);
}

void DispatchTimer::schedule(Clock::time_point time, std::function<void()> action) {
  const std::lock_guard lock(mutex_);
  actions_.emplace(time, std::move(action));
  if (!running_) {
    std::thread([this] { run(); }).detach();
    running_ = true;
  }
  changed_.notify_one();
}

void DispatchTimer::run() noexcept {
  std::unique_lock lock(mutex_);
  while (true) {
    if (actions_.empty()) {
      changed_.wait(lock);
    } else if (const auto next = actions_.begin()->first; next > Clock::now()) {
      changed_.wait_until(lock, next);
    } else {
      auto due = actions_.extract(actions_.begin());
      lock.unlock();
      due.mapped()();
      lock.lock();
    }
  }
}

}  // namespace MarletFoundation
