#pragma once

#include <chrono>
#include <condition_variable>
#include <functional>
#include <map>
#include <mutex>

namespace MarletFoundation {

/// One thread that does small things at given times, started when there is the first. It is never destroyed;
/// its thread ends with the process.
class DispatchTimer {
 public:
  using Clock = std::chrono::steady_clock;

  static DispatchTimer& shared();
  /// The moment `seconds` from now; now when they aren't positive, years ahead when there are too many.
  static Clock::time_point after(double seconds);

  /// Calls `action`, which must not block, at `time`. Actions of one time are called in the order of calls.
  void schedule(Clock::time_point time, std::function<void()> action);

 private:
  DispatchTimer() = default;
  void run() noexcept;

  std::mutex mutex_;
  std::condition_variable changed_;
  std::multimap<Clock::time_point, std::function<void()>> actions_;
  bool running_ = false;
};

}  // namespace MarletFoundation
