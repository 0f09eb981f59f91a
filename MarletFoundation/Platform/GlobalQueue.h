#pragma once

#include "MarletFoundation/Platform/DispatchQueueCore.h"

namespace MarletFoundation {

/// One of the shared queues that run their blocks on the pool.
class GlobalQueue final : public DispatchQueueCore {
 public:
  explicit GlobalQueue(DispatchQuality quality);

  /// The queue of a quality; it lives as long as the process.
  static const std::shared_ptr<GlobalQueue>& of(DispatchQuality quality);

  void sync(BlockReference block, bool barrier) override;
  void async(std::function<void()> block, bool barrier) override;

  const DispatchQuality quality;
};

}  // namespace MarletFoundation
