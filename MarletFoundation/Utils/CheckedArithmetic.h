#pragma once

#include <cstdint>

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

/// Sums of lines, columns and offsets. An overflow is fatal.
inline std::int64_t checkedSum(std::int64_t a, std::int64_t b) {
  std::int64_t sum = 0;
  if (__builtin_add_overflow(a, b, &sum)) fatalError("arithmetic overflow");
  return sum;
}

inline std::int64_t checkedDifference(std::int64_t a, std::int64_t b) {
  std::int64_t difference = 0;
  if (__builtin_sub_overflow(a, b, &difference)) fatalError("arithmetic overflow");
  return difference;
}

}  // namespace MarletFoundation
