#pragma once

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <list>
#include <vector>

#include "MarletFoundation/Platform/GlobalQueue.h"

namespace MarletFoundation {

/// A serial or concurrent queue: a lock that is handed on in order of arrival.
///
/// One atomic word says who holds the queue: one exclusive holder, or a number of shared ones. A free queue
/// is taken and given back with one atomic operation each. Everything else goes through `waiting_`, under the
/// mutex. While anything waits, a bit of the word says so: nobody can then take the queue past the waiting
/// ones, and whoever gives it back hands it on.
///
/// Handing on to an asynchronous block moves the block to `ready_`, holding the queue already, and sends the
/// pool a request to run it. A pool thread that must itself wait for this queue runs ready blocks meanwhile:
/// they stand before it, and every other pool thread may be waiting like itself.
class DispatchLane final : public DispatchQueueCore, public std::enable_shared_from_this<DispatchLane> {
 public:
  DispatchLane(std::string name, bool serial, GlobalQueue& global)
      : DispatchQueueCore(std::move(name), &global), serial_(serial), quality_(global.quality) {}

  void sync(BlockReference block, bool barrier) override;
  void async(std::function<void()> block, bool barrier) override;

 private:
  struct Waiter {
    std::condition_variable wake;
    bool granted = false;
  };
  struct Entry {
    bool exclusive;
    /// Whom to wake; null for an asynchronous block.
    Waiter* waiter;
    std::function<void()> block;
  };
  class Held;

  static constexpr std::uint32_t waitingBit = 1;
  static constexpr std::uint32_t exclusiveBit = 2;
  static constexpr std::uint32_t sharedUnit = 4;

  bool tryAcquire(bool exclusive);
  void waitToAcquire(bool exclusive);
  /// Gives the queue back and hands it on. Returns the number of blocks that became ready by that; the caller
  /// sees to it that they run.
  std::size_t release(bool exclusive);

  /// These are called with the mutex held.
  void append(std::list<Entry> entry);
  std::size_t handOn();
  bool mayHold(bool exclusive) const;
  std::size_t runReadyBlock(std::unique_lock<std::mutex>& lock) noexcept;

  void requestThreads(std::size_t count);
  /// What a request to the pool does: runs one ready block, and one for which that made way, and so on.
  void runReadyBlocks();

  const bool serial_;
  const DispatchQuality quality_;
  std::atomic<std::uint32_t> word_{0};
  std::mutex mutex_;
  std::list<Entry> waiting_;
  std::list<Entry> ready_;
  /// The pool threads that sleep until they get the queue, and could run ready blocks.
  std::vector<Waiter*> helpers_;
};

}  // namespace MarletFoundation
