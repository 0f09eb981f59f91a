#include "MarletFoundation/Utils/Locks.h"

#include <atomic>
#include <cstdint>

namespace MarletFoundation {
namespace {

const DispatchSpecificKey<std::uint64_t> queueMark;

std::uint64_t uniqueMark() {
  static std::atomic<std::uint64_t> last{0};
  return ++last;
}

}  // namespace

RecursiveDispatchLock::RecursiveDispatchLock(std::string name) : queue_(std::move(name)) {
  queue_.setSpecific(queueMark, uniqueMark());
}

bool RecursiveDispatchLock::isHeldHere() const {
  const auto current = DispatchQueue::currentSpecific(queueMark);
  return current && current == queue_.getSpecific(queueMark);
}

}  // namespace MarletFoundation
