#pragma once

#include <cstddef>
#include <memory_resource>

namespace MarletDiff {

/// Where a comparison keeps its lists: memory that is taken in few blocks, large ones in the system's large pages if
/// it has them, and given back all at once. A third of a long text's comparison was the kernel's work for fresh pages.
class WorkMemory : public std::pmr::monotonic_buffer_resource {
 public:
  /// `expected` is how many bytes the first block should hold.
  explicit WorkMemory(std::size_t expected);
};

}  // namespace MarletDiff
