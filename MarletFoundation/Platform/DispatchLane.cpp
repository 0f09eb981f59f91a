#include "MarletFoundation/Platform/DispatchLane.h"

#include "MarletFoundation/Platform/DispatchPool.h"

namespace MarletFoundation {

/// Gives the queue back when a synchronous block ends, also by an exception.
class DispatchLane::Held {
 public:
  Held(DispatchLane& lane, bool exclusive) : lane_(lane), exclusive_(exclusive) {}
  ~Held() {
    if (const auto ready = lane_.release(exclusive_)) lane_.requestThreads(ready);
  }
  Held(const Held&) = delete;
  Held& operator=(const Held&) = delete;

 private:
  DispatchLane& lane_;
  bool exclusive_;
};

void DispatchLane::sync(BlockReference block, bool barrier) {
  const bool exclusive = serial_ || barrier;
  if (!tryAcquire(exclusive)) waitToAcquire(exclusive);
  const Held held(*this, exclusive);
  const Entered entered(*this);
  block();
}

void DispatchLane::async(std::function<void()> block, bool barrier) {
  std::list<Entry> entry;
  entry.push_back({serial_ || barrier, nullptr, std::move(block)});
  std::unique_lock lock(mutex_);
  append(std::move(entry));
  const auto ready = handOn();
  lock.unlock();
  requestThreads(ready);
}

bool DispatchLane::tryAcquire(bool exclusive) {
  if (exclusive) {
    std::uint32_t free = 0;
    return word_.compare_exchange_strong(free, exclusiveBit, std::memory_order_acq_rel,
                                         std::memory_order_relaxed);
  }
  auto word = word_.load(std::memory_order_relaxed);
  while (!(word & (waitingBit | exclusiveBit))) {
    if (word_.compare_exchange_weak(word, word + sharedUnit, std::memory_order_acq_rel,
                                    std::memory_order_relaxed))
      return true;
  }
  return false;
}

void DispatchLane::waitToAcquire(bool exclusive) {
  Waiter waiter;
  std::list<Entry> entry;
  entry.push_back({exclusive, &waiter, {}});
  std::unique_lock lock(mutex_);
  append(std::move(entry));
  // The holder may have gone in the meantime, without having seen anyone wait.
  std::size_t ready = handOn();
  const bool onPool = DispatchPool::isPoolThread();
  while (true) {
    if (ready) {
      lock.unlock();
      requestThreads(ready);
      lock.lock();
      ready = 0;
    } else if (waiter.granted) {
      return;
    } else if (onPool && !ready_.empty()) {
      ready = runReadyBlock(lock);
    } else {
      if (onPool) helpers_.push_back(&waiter);
      waiter.wake.wait(lock);
      if (onPool) std::erase(helpers_, &waiter);
    }
  }
}

std::size_t DispatchLane::release(bool exclusive) {
  if (exclusive) {
    auto word = exclusiveBit;
    if (word_.compare_exchange_strong(word, 0, std::memory_order_release, std::memory_order_relaxed))
      return 0;
    const std::lock_guard lock(mutex_);
    word_.fetch_and(~exclusiveBit, std::memory_order_acq_rel);
    return handOn();
  }
  if (word_.fetch_sub(sharedUnit, std::memory_order_acq_rel) != (sharedUnit | waitingBit)) return 0;
  const std::lock_guard lock(mutex_);
  return handOn();
}

void DispatchLane::append(std::list<Entry> entry) {
  waiting_.splice(waiting_.end(), entry);
  word_.fetch_or(waitingBit, std::memory_order_acq_rel);
}

bool DispatchLane::mayHold(bool exclusive) const {
  const auto holders = word_.load(std::memory_order_acquire) & ~waitingBit;
  return exclusive ? holders == 0 : !(holders & exclusiveBit);
}

std::size_t DispatchLane::handOn() {
  // While the waiting bit is set, others can only give the queue back: what may be held now stays so.
  std::size_t ready = 0;
  while (!waiting_.empty() && mayHold(waiting_.front().exclusive)) {
    const auto& next = waiting_.front();
    word_.fetch_add(next.exclusive ? exclusiveBit : sharedUnit, std::memory_order_acq_rel);
    if (next.waiter) {
      next.waiter->granted = true;
      std::erase(helpers_, next.waiter);
      // Notified under the mutex: without it, the waiter could be gone before the call.
      next.waiter->wake.notify_one();
      waiting_.pop_front();
    } else {
      ready_.splice(ready_.end(), waiting_, waiting_.begin());
      ++ready;
    }
  }
  if (waiting_.empty()) word_.fetch_and(~waitingBit, std::memory_order_acq_rel);
  if (!ready_.empty() && !helpers_.empty()) helpers_.front()->wake.notify_one();
  return ready;
}

std::size_t DispatchLane::runReadyBlock(std::unique_lock<std::mutex>& lock) noexcept {
  std::list<Entry> entry;
  entry.splice(entry.end(), ready_, ready_.begin());
  lock.unlock();
  {
    const Entered entered(*this);
    runToEnd(entry.front().block);
  }
  const auto ready = release(entry.front().exclusive);
  lock.lock();
  return ready;
}

void DispatchLane::runReadyBlocks() {
  std::unique_lock lock(mutex_);
  // A request that finds nothing was overtaken by a thread that was waiting for the queue.
  while (!ready_.empty()) {
    const auto ready = runReadyBlock(lock);
    if (!ready) return;
    // This thread goes on with one of the blocks that its own has made way for.
    if (ready > 1) {
      lock.unlock();
      requestThreads(ready - 1);
      lock.lock();
    }
  }
}

void DispatchLane::requestThreads(std::size_t count) {
  for (; count > 0; --count)
    DispatchPool::shared().submit(quality_, [self = shared_from_this()] { self->runReadyBlocks(); });
}

}  // namespace MarletFoundation
