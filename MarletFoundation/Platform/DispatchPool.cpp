#include "MarletFoundation/Platform/DispatchPool.h"

#include <algorithm>
#include <system_error>
#include <thread>

#include "MarletFoundation/Platform/DispatchTimer.h"
#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t fewestUsualThreads = 4;
constexpr std::size_t mostThreads = 64;
constexpr std::chrono::milliseconds stallTime{5};

thread_local bool onPoolThread = false;

}  // namespace

DispatchPool& DispatchPool::shared() {
  static auto& pool = *new DispatchPool;
  return pool;
}

bool DispatchPool::isPoolThread() { return onPoolThread; }

DispatchPool::DispatchPool()
    : usualThreads_(
          std::clamp<std::size_t>(std::thread::hardware_concurrency(), fewestUsualThreads, mostThreads)) {}

void DispatchPool::submit(DispatchQuality quality, std::function<void()> work) {
  const std::lock_guard lock(mutex_);
  pending_[static_cast<std::size_t>(quality)].push_back(std::move(work));
  ++pendingCount_;
  if (pendingCount_ <= idle_) {
    wake_.notify_one();
  } else if (threads_ < usualThreads_) {
    startThread();
  } else {
    watchForStall();
  }
}

void DispatchPool::startThread() {
  try {
    std::thread([this] { work(); }).detach();
    ++threads_;
  } catch (const std::system_error& error) {
    if (threads_ == 0) fatalError(std::string("no thread for work queues: ") + error.what());
  }
}

void DispatchPool::watchForStall() {
  if (watching_ || threads_ >= mostThreads) return;
  watching_ = true;
  DispatchTimer::shared().schedule(DispatchTimer::Clock::now() + stallTime, [this, begun = begun_] {
    const std::lock_guard lock(mutex_);
    watching_ = false;
    if (pendingCount_ <= idle_) return;
    if (begun == begun_) startThread();
    watchForStall();
  });
}

std::function<void()> DispatchPool::takeNext() {
  const auto queue = std::find_if(pending_.begin(), pending_.end(), [](const auto& q) { return !q.empty(); });
  auto next = std::move(queue->front());
  queue->pop_front();
  --pendingCount_;
  ++begun_;
  return next;
}

void DispatchPool::work() noexcept {
  onPoolThread = true;
  std::unique_lock lock(mutex_);
  while (true) {
    if (pendingCount_ == 0 && threads_ > usualThreads_) {
      --threads_;
      return;
    }
    ++idle_;
    wake_.wait(lock, [this] { return pendingCount_ > 0; });
    --idle_;
    auto next = takeNext();
    lock.unlock();
    next();
    next = nullptr;
    lock.lock();
  }
}

}  // namespace MarletFoundation
