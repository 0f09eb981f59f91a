#include "MarletFoundation/Platform/GlobalQueue.h"

#include <array>

#include "MarletFoundation/Platform/DispatchPool.h"

namespace MarletFoundation {
namespace {

constexpr std::array<const char*, dispatchQualityCount> labels{
    "global queue, user-interactive", "global queue, user-initiated", "global queue, default",
    "global queue, utility", "global queue, background"};

std::size_t index(DispatchQuality quality) { return static_cast<std::size_t>(quality); }

}  // namespace

GlobalQueue::GlobalQueue(DispatchQuality q) : DispatchQueueCore(labels[index(q)], nullptr), quality(q) {}

const std::shared_ptr<GlobalQueue>& GlobalQueue::of(DispatchQuality quality) {
  // Never destroyed: threads of the pool may run until the very end of the process.
  static const auto& queues = *[] {
    auto* made = new std::array<std::shared_ptr<GlobalQueue>, dispatchQualityCount>;
    for (std::size_t i = 0; i < made->size(); ++i)
      (*made)[i] = std::make_shared<GlobalQueue>(static_cast<DispatchQuality>(i));
    return made;
  }();
  return queues[index(quality)];
}

void GlobalQueue::sync(BlockReference block, bool) {
  const Entered entered(*this);
  block();
}

void GlobalQueue::async(std::function<void()> block, bool) {
  DispatchPool::shared().submit(quality, [this, work = std::move(block)]() mutable {
    const Entered entered(*this);
    runToEnd(work);
  });
}

}  // namespace MarletFoundation
