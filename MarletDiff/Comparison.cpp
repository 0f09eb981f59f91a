#include "MarletDiff/Comparison.h"

#include <algorithm>

namespace MarletDiff {
namespace {

/// A round of the search costs memory for as many points as it has edits, and the rounds before it are kept
/// to find the way back: 2048 rounds take 16 MB.
constexpr std::size_t maximumEdits = 2048;

/// Myers' greedy search. A point (x, y) has passed x tokens of one list and y of the other; one edit moves it
/// by one token of one list, and equal tokens carry it on for free. Round d finds, for every diagonal x - y
/// from -d to d in steps of 2, the furthest point that d edits reach.
class Search {
 public:
  Search(const Tokens& a, const Tokens& b, std::size_t prefix, std::size_t suffix, std::int64_t& budget)
      : a_(a),
        b_(b),
        prefix_(prefix),
        n_(static_cast<std::int64_t>(a.size() - prefix - suffix)),
        m_(static_cast<std::int64_t>(b.size() - prefix - suffix)),
        budget_(budget) {}

  std::vector<TokenChange> run() {
    reached_.push_back(followEqual(0, 0));
    std::size_t edits = 0;
    while (!foundEnd(edits) && edits < maximumEdits && budget_ > 0) {
      if (!searchRound(edits + 1)) break;
      ++edits;
    }
    return wayBack(edits);
  }

 private:
  static std::size_t roundStart(std::size_t edits) { return edits * (edits + 1) / 2; }
  static std::int64_t diagonal(std::size_t edits, std::size_t index) {
    return 2 * static_cast<std::int64_t>(index) - static_cast<std::int64_t>(edits);
  }
  std::int64_t x(std::size_t edits, std::size_t index) const { return reached_[roundStart(edits) + index]; }

  /// Whether the last edit that leads to a point of this round passed a token of `b`, from the neighbour of
  /// the same index in the round before, and not one of `a`, from the neighbour ahead of that.
  bool cameDown(std::size_t edits, std::size_t index) const {
    return index == 0 || (index < edits && x(edits - 1, index - 1) < x(edits - 1, index));
  }
  std::int64_t afterEdit(std::size_t edits, std::size_t index) const {
    return cameDown(edits, index) ? x(edits - 1, index) : x(edits - 1, index - 1) + 1;
  }

  bool equal(std::int64_t x, std::int64_t y) {
    const auto first = a_[prefix_ + static_cast<std::size_t>(x)];
    const auto second = b_[prefix_ + static_cast<std::size_t>(y)];
    --budget_;
    if (first.size() != second.size()) return false;
    budget_ -= static_cast<std::int64_t>(first.size() / 16);
    return first == second;
  }

  std::int64_t followEqual(std::int64_t x, std::int64_t diagonal) {
    while (x < n_ && x - diagonal < m_ && equal(x, x - diagonal)) ++x;
    return x;
  }

  /// False when the budget ends first; then the round before is the last.
  bool searchRound(std::size_t edits) {
    for (std::size_t index = 0; index <= edits; ++index) {
      if (--budget_ < 0) return false;
      reached_.push_back(followEqual(afterEdit(edits, index), diagonal(edits, index)));
    }
    return true;
  }

  bool foundEnd(std::size_t edits) const {
    const auto index = n_ - m_ + static_cast<std::int64_t>(edits);
    return index >= 0 && index % 2 == 0 && index / 2 <= static_cast<std::int64_t>(edits) &&
           x(edits, static_cast<std::size_t>(index / 2)) == n_;
  }

  /// The point of a round that has passed the most tokens; a search may run beyond either list's end, from
  /// where no way leads to the end of both.
  std::size_t furthest(std::size_t edits) const {
    std::size_t best = 0;
    std::int64_t bestSum = -1;
    for (std::size_t index = 0; index <= edits; ++index) {
      const auto px = x(edits, index), py = px - diagonal(edits, index);
      if (px <= n_ && py <= m_ && px + py > bestSum) {
        best = index;
        bestSum = px + py;
      }
    }
    return best;
  }

  std::vector<TokenChange> wayBack(std::size_t edits) const {
    std::vector<TokenChange> changes;
    const auto add = [&](std::int64_t x, std::int64_t xEnd, std::int64_t y, std::int64_t yEnd) {
      const auto token = [&](std::int64_t at) { return prefix_ + static_cast<std::size_t>(at); };
      if (!changes.empty() && changes.back().original == token(xEnd) &&
          changes.back().modified == token(yEnd)) {
        changes.back().original = token(x);
        changes.back().modified = token(y);
      } else {
        changes.push_back({token(x), token(xEnd), token(y), token(yEnd)});
      }
    };
    auto index = furthest(edits);
    const auto lastX = x(edits, index), lastY = lastX - diagonal(edits, index);
    if (lastX < n_ || lastY < m_) add(lastX, n_, lastY, m_);
    for (; edits > 0; --edits) {
      const bool down = cameDown(edits, index);
      const auto px = afterEdit(edits, index), py = px - diagonal(edits, index);
      add(down ? px : px - 1, px, down ? py - 1 : py, py);
      if (!down) --index;
    }
    std::reverse(changes.begin(), changes.end());
    return changes;
  }

  const Tokens& a_;
  const Tokens& b_;
  std::size_t prefix_;
  std::int64_t n_;
  std::int64_t m_;
  std::int64_t& budget_;
  /// The x of each point, round after round.
  std::vector<std::int64_t> reached_;
};

}  // namespace

std::vector<TokenChange> changes(const Tokens& original, const Tokens& modified, std::int64_t& budget) {
  const auto shorter = std::min(original.size(), modified.size());
  std::size_t prefix = 0, suffix = 0;
  while (prefix < shorter && original[prefix] == modified[prefix]) ++prefix;
  while (suffix < shorter - prefix &&
         original[original.size() - 1 - suffix] == modified[modified.size() - 1 - suffix]) {
    ++suffix;
  }
  if (prefix == original.size() && prefix == modified.size()) return {};
  return Search(original, modified, prefix, suffix, budget).run();
}

}  // namespace MarletDiff
