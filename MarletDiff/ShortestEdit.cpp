#include "MarletDiff/ShortestEdit.h"

#include <algorithm>
#include <limits>

namespace MarletDiff {

void appendRun(std::pmr::vector<TokenRun>& runs, const TokenRun& run) {
  if (run.length == 0) return;
  if (!runs.empty()) {
    auto& last = runs.back();
    if (last.original + last.length == run.original && last.modified + last.length == run.modified) {
      last.length += run.length;
      return;
    }
  }
  runs.push_back(run);
}

void ShortestEdit::start(std::span<const std::uint32_t> original, std::span<const std::uint32_t> modified) {
  original_ = original;
  modified_ = modified;
}

void ShortestEdit::appendRuns(Box box, std::pmr::vector<TokenRun>& runs, std::int64_t& budget) {
  const auto shorter = std::min(box.originalEnd - box.original, box.modifiedEnd - box.modified);
  std::uint32_t prefix = 0, suffix = 0;
  while (prefix < shorter && original_[box.original + prefix] == modified_[box.modified + prefix]) ++prefix;
  while (suffix < shorter - prefix &&
         original_[box.originalEnd - 1 - suffix] == modified_[box.modifiedEnd - 1 - suffix]) {
    ++suffix;
  }
  appendRun(runs, {box.original, box.modified, prefix});
  box.original += prefix, box.modified += prefix;
  box.originalEnd -= suffix, box.modifiedEnd -= suffix;
  Point middle;
  if (box.original < box.originalEnd && box.modified < box.modifiedEnd && split(box, middle, budget)) {
    const auto x = static_cast<std::uint32_t>(middle.original),
               y = static_cast<std::uint32_t>(middle.modified);
    appendRuns({box.original, x, box.modified, y}, runs, budget);
    appendRuns({x, box.originalEnd, y, box.modifiedEnd}, runs, budget);
  }
  appendRun(runs, {box.originalEnd, box.modifiedEnd, suffix});
}

/// Finds a point in the middle of a shortest way through the box, whose lists neither start nor end alike.
/// Searches from both ends take turns, an edit more at a time, until they meet on a diagonal. False when the
/// budget ends first.
bool ShortestEdit::split(const Box& box, Point& point, std::int64_t& budget) {
  const auto signedOf = [](std::uint32_t value) { return static_cast<std::int32_t>(value); };
  const auto start = signedOf(box.original), end = signedOf(box.originalEnd);
  const auto otherStart = signedOf(box.modified), otherEnd = signedOf(box.modifiedEnd);
  const auto lowest = start - otherEnd, highest = end - otherStart;
  const auto forwardMiddle = start - otherStart, backwardMiddle = end - otherEnd;
  // With an odd number of edits it is the forward search that meets the other, else the backward one.
  const bool odd = ((forwardMiddle - backwardMiddle) & 1) != 0;

  const auto diagonals = static_cast<std::size_t>(highest - lowest) + 3;
  if (forward_.size() < diagonals) {
    forward_.resize(diagonals);
    backward_.resize(diagonals);
  }
  auto* forward = forward_.data() + (1 - lowest);
  auto* backward = backward_.data() + (1 - lowest);
  const auto* a = original_.data();
  const auto* b = modified_.data();
  forward[forwardMiddle] = start;
  backward[backwardMiddle] = end;
  auto forwardLow = forwardMiddle, forwardHigh = forwardMiddle;
  auto backwardLow = backwardMiddle, backwardHigh = backwardMiddle;

  while (budget > 0) {
    // A diagonal outside the box is left out; beside the outermost ones stands a place that never wins.
    if (forwardLow > lowest) {
      forward[--forwardLow - 1] = -1;
    } else {
      ++forwardLow;
    }
    if (forwardHigh < highest) {
      forward[++forwardHigh + 1] = -1;
    } else {
      --forwardHigh;
    }
    for (auto diagonal = forwardHigh; diagonal >= forwardLow; diagonal -= 2) {
      const auto from = std::max(forward[diagonal - 1] + 1, forward[diagonal + 1]);
      auto x = from;
      while (x < end && x - diagonal < otherEnd && a[x] == b[x - diagonal]) ++x;
      forward[diagonal] = x;
      budget -= 1 + (x - from);
      if (odd && backwardLow <= diagonal && diagonal <= backwardHigh && backward[diagonal] <= x) {
        point = {x, x - diagonal};
        return true;
      }
    }

    if (backwardLow > lowest) {
      backward[--backwardLow - 1] = std::numeric_limits<std::int32_t>::max();
    } else {
      ++backwardLow;
    }
    if (backwardHigh < highest) {
      backward[++backwardHigh + 1] = std::numeric_limits<std::int32_t>::max();
    } else {
      --backwardHigh;
    }
    for (auto diagonal = backwardHigh; diagonal >= backwardLow; diagonal -= 2) {
      const auto from = std::min(backward[diagonal - 1], backward[diagonal + 1] - 1);
      auto x = from;
      while (x > start && x - diagonal > otherStart && a[x - 1] == b[x - diagonal - 1]) --x;
      backward[diagonal] = x;
      budget -= 1 + (from - x);
      if (!odd && forwardLow <= diagonal && diagonal <= forwardHigh && x <= forward[diagonal]) {
        point = {x, x - diagonal};
        return true;
      }
    }
  }
  return false;
}

}  // namespace MarletDiff
