#include "MarletDiff/Comparison.h"

#include <algorithm>
#include <limits>

namespace MarletDiff {
namespace {

constexpr auto none = std::numeric_limits<std::uint32_t>::max();

}  // namespace

/// Takes the tokens without a partner out of both lists.
void Comparison::dropUnmatched(std::pmr::vector<std::uint32_t>& original,
                               std::pmr::vector<std::uint32_t>& modified, std::size_t numbers) {
  occurrences_.assign(numbers + 1, {});
  for (const auto number : original) occurrences_[number].original.add();
  for (const auto number : modified) occurrences_[number].modified.add();
  originalPlaces_.resize(original.size());
  modifiedPlaces_.resize(modified.size());
  std::uint32_t count = 0;
  for (std::uint32_t i = 0; i < original.size(); ++i) {
    const auto number = original[i];
    original[count] = number;
    originalPlaces_[count] = i;
    count += occurrences_[number].modified.any();
  }
  original.resize(count);
  count = 0;
  for (std::uint32_t i = 0; i < modified.size(); ++i) {
    const auto number = modified[i];
    auto& occurrences = occurrences_[number];
    modified[count] = number;
    modifiedPlaces_[count] = i;
    occurrences.lastModified = count;
    count += occurrences.original.any();
  }
  modified.resize(count);
}

/// Leaves in `anchors_` the longest row of tokens that are unique in both lists and ascend in both.
void Comparison::findAnchors(const std::pmr::vector<std::uint32_t>& original) {
  anchors_.clear();
  anchors_.reserve(original.size());
  rowEnds_.clear();
  rowEnds_.reserve(original.size());
  for (std::uint32_t i = 0; i < original.size(); ++i) {
    const auto& occurrences = occurrences_[original[i]];
    if (!occurrences.original.one() || !occurrences.modified.one()) continue;
    const auto place = occurrences.lastModified;
    auto row = rowEnds_.end();
    if (!rowEnds_.empty() && anchors_[rowEnds_.back()].modified > place) {
      row =
          std::lower_bound(rowEnds_.begin(), rowEnds_.end(), place,
                           [&](std::uint32_t end, std::uint32_t at) { return anchors_[end].modified < at; });
    }
    const auto added = static_cast<std::uint32_t>(anchors_.size());
    anchors_.push_back({i, place, row == rowEnds_.begin() ? none : *(row - 1)});
    if (row == rowEnds_.end()) {
      rowEnds_.push_back(added);
    } else {
      *row = added;
    }
  }
  // The row from its last anchor back to the first, put in its place.
  for (auto at = rowEnds_.size(), next = std::size_t{rowEnds_.empty() ? none : rowEnds_.back()}; at > 0;
       --at) {
    rowEnds_[at - 1] = static_cast<std::uint32_t>(next);
    next = anchors_[next].previous;
  }
  for (std::size_t i = 0; i < rowEnds_.size(); ++i) anchors_[i] = anchors_[rowEnds_[i]];
  anchors_.resize(rowEnds_.size());
}

const std::pmr::vector<Change>& Comparison::changes(std::pmr::vector<std::uint32_t>& original,
                                                    std::pmr::vector<std::uint32_t>& modified,
                                                    std::size_t numbers, std::int64_t& budget) {
  const auto originalSize = static_cast<std::uint32_t>(original.size());
  const auto modifiedSize = static_cast<std::uint32_t>(modified.size());
  dropUnmatched(original, modified, numbers);
  findAnchors(original);

  runs_.clear();
  shortestEdit_.start(original, modified);
  std::uint32_t originalDone = 0, modifiedDone = 0;
  const auto compareUpTo = [&](std::size_t originalEnd, std::size_t modifiedEnd) {
    const ShortestEdit::Box box{originalDone, static_cast<std::uint32_t>(originalEnd), modifiedDone,
                                static_cast<std::uint32_t>(modifiedEnd)};
    const bool isEmpty = box.original == box.originalEnd || box.modified == box.modifiedEnd;
    if (!isEmpty) shortestEdit_.appendRuns(box, runs_, budget);
  };
  for (const auto& anchor : anchors_) {
    compareUpTo(anchor.original, anchor.modified);
    appendRun(runs_, {anchor.original, anchor.modified, 1});
    originalDone = anchor.original + 1;
    modifiedDone = anchor.modified + 1;
  }
  compareUpTo(original.size(), modified.size());

  changes_.clear();
  Change gap{0, 0, 0, 0};
  const auto match = [&](std::uint32_t i, std::uint32_t j) {
    gap.originalEnd = i;
    gap.modifiedEnd = j;
    if (gap.original < i || gap.modified < j) changes_.push_back(gap);
    gap.original = i + 1;
    gap.modified = j + 1;
  };
  for (const auto& run : runs_) {
    for (std::uint32_t i = 0; i < run.length; ++i) {
      match(originalPlaces_[run.original + i], modifiedPlaces_[run.modified + i]);
    }
  }
  match(originalSize, modifiedSize);
  return changes_;
}

}  // namespace MarletDiff
