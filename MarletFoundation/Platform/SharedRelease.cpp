#include "MarletFoundation/Platform/SharedRelease.h"

#include <new>
#include <utility>
#include <vector>

namespace MarletFoundation {
namespace {

/// What the object that goes at the moment has handed over.
struct HandedOver {
  /// A chain needs this place only, and so no memory.
  std::shared_ptr<const void> first;
  std::vector<std::shared_ptr<const void>> others;

  std::shared_ptr<const void> next() {
    if (first || others.empty()) return std::exchange(first, nullptr);
    auto last = std::move(others.back());
    others.pop_back();
    return last;
  }
};

/// Of the release that goes on on this thread; null outside of one.
thread_local HandedOver* handedOver = nullptr;

}  // namespace

void releaseWithoutStack(std::shared_ptr<const void> link) noexcept {
  if (!link) return;
  if (!handedOver) {
    HandedOver own;
    handedOver = &own;
    for (; link; link = own.next()) link.reset();
    handedOver = nullptr;
  } else if (!handedOver->first) {
    handedOver->first = std::move(link);
  } else {
    try {
      handedOver->others.push_back(std::move(link));
    } catch (const std::bad_alloc&) {
      // It goes here, on the stack.
    }
  }
}

}  // namespace MarletFoundation
