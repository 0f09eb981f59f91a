#pragma once

#include "MarletFoundation/Platform/DispatchQueue.h"

/// @file
/// Mutual exclusion by work queues. The locks are values: copies share one queue. The synchronous forms give
/// back what the block returns or throws, and run it on the calling thread; a lock that is free costs neither
/// a switch of threads nor an allocation. The asynchronous forms queue the block and return at once.
namespace MarletFoundation {

/// Runs one block at a time, in the order of arrival. A `lock` inside the same lock waits for ever.
class MARLET_EXPORT DispatchLock {
 public:
  explicit DispatchLock(std::string name) : queue_(std::move(name)) {}

  const DispatchQueue& queue() const { return queue_; }

  template <std::invocable Block>
  std::invoke_result_t<Block&> lock(Block&& block) const {
    return queue_.sync(block);
  }
  void asyncLock(std::function<void()> block) const { queue_.async(std::move(block)); }

 private:
  DispatchQueue queue_;
};

/// A lock that may be taken again directly inside itself. With another queue's block in between, the inner
/// one waits for ever, since only the innermost queue is known to the block that runs.
class MARLET_EXPORT RecursiveDispatchLock {
 public:
  explicit RecursiveDispatchLock(std::string name);

  const DispatchQueue& queue() const { return queue_; }

  template <std::invocable Block>
  std::invoke_result_t<Block&> lock(Block&& block) const {
    if (isHeldHere()) return block();
    return queue_.sync(block);
  }
  /// Always queues, also inside the lock.
  void asyncLock(std::function<void()> block) const { queue_.async(std::move(block)); }

 private:
  bool isHeldHere() const;

  DispatchQueue queue_;
};

/// Readers overlap; a writer runs alone. Whoever comes after a waiting writer waits behind it.
class MARLET_EXPORT ReaderWriterDispatchLock {
 public:
  explicit ReaderWriterDispatchLock(std::string name)
      : queue_(std::move(name), DispatchQueue::Kind::concurrent) {}

  const DispatchQueue& queue() const { return queue_; }

  template <std::invocable Block>
  std::invoke_result_t<Block&> read(Block&& block) const {
    return queue_.sync(block);
  }
  void asyncRead(std::function<void()> block) const { queue_.async(std::move(block)); }

  template <std::invocable Block>
  std::invoke_result_t<Block&> write(Block&& block) const {
    return queue_.syncBarrier(block);
  }
  void asyncWrite(std::function<void()> block) const { queue_.asyncBarrier(std::move(block)); }

 private:
  DispatchQueue queue_;
};

}  // namespace MarletFoundation
