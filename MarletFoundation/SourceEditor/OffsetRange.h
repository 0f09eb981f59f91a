#pragma once

#include <cstdint>

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

/// The offsets from `lowerBound` up to, not including, `upperBound`. Bounds in the wrong order are fatal.
struct OffsetRange {
  std::int64_t lowerBound;
  std::int64_t upperBound;

  OffsetRange(std::int64_t lower, std::int64_t upper) : lowerBound(lower), upperBound(upper) {
    if (lower > upper) fatalError("a range ends in front of its start");
  }
  bool operator==(const OffsetRange&) const = default;
};

}  // namespace MarletFoundation
