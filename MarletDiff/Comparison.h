#pragma once

#include <cstdint>
#include <memory_resource>
#include <vector>

#include "MarletDiff/ShortestEdit.h"

namespace MarletDiff {

/// A stretch of either list and what it became; either may be empty. Ends are exclusive.
struct Change {
  std::uint32_t original;
  std::uint32_t originalEnd;
  std::uint32_t modified;
  std::uint32_t modifiedEnd;
};

/// Compares lists of numbered tokens. An object may be used again; it keeps its memory.
class Comparison {
 public:
  explicit Comparison(std::pmr::memory_resource* memory)
      : occurrences_(memory),
        originalPlaces_(memory),
        modifiedPlaces_(memory),
        anchors_(memory),
        rowEnds_(memory),
        shortestEdit_(memory),
        runs_(memory),
        changes_(memory) {}

  /// The changes that lead from one list to the other, ascending, with an equal token between any two of
  /// them. A number is less than `numbers`, or that itself for a modified token without a partner. Takes its
  /// work off `budget`; where that ends, a change takes in all that isn't compared yet. Leaves in the lists just
  /// the tokens that have a partner in the other.
  const std::pmr::vector<Change>& changes(std::pmr::vector<std::uint32_t>& original,
                                          std::pmr::vector<std::uint32_t>& modified, std::size_t numbers,
                                          std::int64_t& budget);

 private:
  /// None, one or more.
  class Count {
   public:
    void add() { count_ += count_ < 2; }
    bool any() const { return count_ != 0; }
    bool one() const { return count_ == 1; }

   private:
    std::uint8_t count_ = 0;
  };
  /// What is known of the tokens of one number.
  struct Occurrences {
    Count original;
    Count modified;
    /// Where it is among the modified tokens that have a partner.
    std::uint32_t lastModified = 0;
  };
  /// Tokens of either list that are matched with each other, by their places among those with a partner.
  struct Anchor {
    std::uint32_t original;
    std::uint32_t modified;
    /// The anchor that comes before in the longest ascending row that ends here.
    std::uint32_t previous;
  };

  void dropUnmatched(std::pmr::vector<std::uint32_t>& original, std::pmr::vector<std::uint32_t>& modified,
                     std::size_t numbers);
  void findAnchors(const std::pmr::vector<std::uint32_t>& original);

  std::pmr::vector<Occurrences> occurrences_;
  /// Where in the whole lists the tokens stand that have a partner.
  std::pmr::vector<std::uint32_t> originalPlaces_, modifiedPlaces_;
  std::pmr::vector<Anchor> anchors_;
  std::pmr::vector<std::uint32_t> rowEnds_;
  ShortestEdit shortestEdit_;
  std::pmr::vector<TokenRun> runs_;
  std::pmr::vector<Change> changes_;
};

}  // namespace MarletDiff
