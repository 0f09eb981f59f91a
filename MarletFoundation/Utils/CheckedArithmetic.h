#pragma once

#include <cstdint>
#include <limits>

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

/// Whether a line or an offset that a document holds leaves room for sums with what texts have of them. Beyond, it is
/// damage: no text reaches so far.
constexpr bool leavesRoomForSums(std::int64_t number) {
  using Limits = std::numeric_limits<std::int64_t>;
  constexpr std::int64_t room = std::int64_t{1} << 40;
  return number >= Limits::min() + room && number <= Limits::max() - room;
}

}  // namespace MarletFoundation
