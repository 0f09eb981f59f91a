#include "MarletFoundation/Platform/DispatchQueue.h"

#include "MarletFoundation/Platform/DispatchLane.h"
#include "MarletFoundation/Platform/DispatchTimer.h"
#include "MarletFoundation/Platform/MainQueue.h"

namespace MarletFoundation {

DispatchQueue::DispatchQueue(std::string label, Kind kind, DispatchQuality target)
    : core_(
          std::make_shared<DispatchLane>(std::move(label), kind == Kind::serial, *GlobalQueue::of(target))) {}

DispatchQueue DispatchQueue::main() { return DispatchQueue(MainQueue::shared()); }

DispatchQueue DispatchQueue::global(DispatchQuality quality) {
  return DispatchQueue(GlobalQueue::of(quality));
}

const std::string& DispatchQueue::label() const { return core_->label; }

void DispatchQueue::async(std::function<void()> block) const { core_->async(std::move(block), false); }

void DispatchQueue::asyncBarrier(std::function<void()> block) const { core_->async(std::move(block), true); }

void DispatchQueue::asyncAfter(double seconds, std::function<void()> block) const {
  if (!(seconds > 0)) return async(std::move(block));
  DispatchTimer::shared().schedule(
      DispatchTimer::after(seconds),
      [queue = *this, work = std::move(block)]() mutable { queue.async(std::move(work)); });
}

void DispatchQueue::submitReference(BlockReference block, bool barrier) const { core_->sync(block, barrier); }

void DispatchQueue::setValue(const void* key, std::any value) const {
  core_->setValue(key, std::move(value));
}

std::any DispatchQueue::value(const void* key) const { return core_->value(key); }

std::any DispatchQueue::currentValue(const void* key) {
  for (const auto* queue = DispatchQueueCore::current(); queue; queue = queue->target) {
    if (auto value = queue->value(key); value.has_value()) return value;
  }
  return {};
}

bool runUntil(const std::function<bool()>& predicate, double timeout) {
  return MainQueue::shared()->pumpUntil(predicate, DispatchTimer::after(timeout));
}

}  // namespace MarletFoundation
