#include "MarletFoundation/Platform/WriteCancellation.h"

#include <atomic>

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {
namespace {

std::atomic<bool> cancelled{false};
std::atomic<int> underWay{0};
static_assert(std::atomic<bool>::is_always_lock_free && std::atomic<int>::is_always_lock_free);

}  // namespace

void cancelWrites() noexcept { cancelled = true; }

bool isWriting() noexcept { return underWay > 0; }

void requireNotCancelled(std::string_view path) {
  if (cancelled) throwPosix(ECANCELED, path);
}

WriteUnderWay::WriteUnderWay() noexcept { ++underWay; }

WriteUnderWay::~WriteUnderWay() { --underWay; }

}  // namespace MarletFoundation
