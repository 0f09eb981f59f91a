#pragma once

#include <cstdint>
#include <memory_resource>
#include <span>
#include <vector>

namespace MarletDiff {

/// So many tokens from a place in either list on that are equal, pair by pair.
struct TokenRun {
  std::uint32_t original;
  std::uint32_t modified;
  std::uint32_t length;
};

/// Appends a run, to the last one where it goes on from there.
void appendRun(std::pmr::vector<TokenRun>& runs, const TokenRun& run);

/// Myers' search for the fewest insertions and removals, in linear space. An object may be used again.
class ShortestEdit {
 public:
  /// A part of either list; ends are exclusive.
  struct Box {
    std::uint32_t original;
    std::uint32_t originalEnd;
    std::uint32_t modified;
    std::uint32_t modifiedEnd;
  };

  explicit ShortestEdit(std::pmr::memory_resource* memory) : forward_(memory), backward_(memory) {}

  /// Sets the lists, which must stay as they are while their boxes are compared.
  void start(std::span<const std::uint32_t> original, std::span<const std::uint32_t> modified);
  /// Appends the runs of equal tokens in a box, ascending. Takes the tokens and diagonals it looks at off
  /// `budget`; where that ends, nothing in the box but what its ends share counts as equal.
  void appendRuns(Box box, std::pmr::vector<TokenRun>& runs, std::int64_t& budget);

 private:
  struct Point {
    std::int32_t original;
    std::int32_t modified;
  };
  bool split(const Box& box, Point& point, std::int64_t& budget);

  std::span<const std::uint32_t> original_, modified_;
  /// For each diagonal, the place in the original that a search from the box's start or end has reached.
  std::pmr::vector<std::int32_t> forward_, backward_;
};

}  // namespace MarletDiff
