#include "MarletFoundation/Platform/PropertyListWork.h"

#include <utility>

namespace MarletFoundation {
namespace {

thread_local std::size_t done = 0;

}  // namespace

void countPropertyListWork(std::size_t steps) noexcept { done += steps; }
std::size_t takePropertyListWork() noexcept { return std::exchange(done, 0); }

}  // namespace MarletFoundation
