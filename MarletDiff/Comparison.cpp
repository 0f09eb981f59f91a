#include "MarletDiff/Comparison.h"

#include <algorithm>
#include <limits>

namespace MarletDiff {
namespace {

constexpr auto none = std::numeric_limits<std::uint32_t>::max();

}  // namespace

void Comparison::countOccurrences(std::span<const std::uint32_t> original,
                                  std::span<const std::uint32_t> modified, std::size_t numbers) {
  occurrences_.assign(numbers + 1, {});
  for (const auto number : original) ++occurrences_[number].original;
  for (const auto number : modified) ++occurrences_[number].modified;
  original_.resize(original.size()), originalPlaces_.resize(original.size());
  modified_.resize(modified.size()), modifiedPlaces_.resize(modified.size());
  std::uint32_t count = 0;
  for (std::uint32_t i = 0; i < original.size(); ++i) {
    original_[count] = original[i];
    originalPlaces_[count] = i;
    count += occurrences_[original[i]].modified != 0;
  }
  original_.resize(count), originalPlaces_.resize(count);
  count = 0;
  for (std::uint32_t i = 0; i < modified.size(); ++i) {
    auto& occurrences = occurrences_[modified[i]];
    modified_[count] = modified[i];
    modifiedPlaces_[count] = i;
    occurrences.lastModified = count;
    count += occurrences.original != 0;
  }
  modified_.resize(count), modifiedPlaces_.resize(count);
}

/// Leaves in `anchors_` the longest row of tokens that are unique in both lists and ascend in both.
void Comparison::findAnchors() {
  anchors_.clear();
  rowEnds_.clear();
  for (std::uint32_t i = 0; i < original_.size(); ++i) {
    const auto& occurrences = occurrences_[original_[i]];
    if (occurrences.original != 1 || occurrences.modified != 1) continue;
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

const std::vector<Change>& Comparison::changes(std::span<const std::uint32_t> original,
                                               std::span<const std::uint32_t> modified, std::size_t numbers,
                                               std::int64_t& budget) {
  countOccurrences(original, modified, numbers);
  findAnchors();

  runs_.clear();
  shortestEdit_.start(original_, modified_);
  std::uint32_t originalDone = 0, modifiedDone = 0;
  for (const auto& anchor : anchors_) {
    shortestEdit_.appendRuns({originalDone, anchor.original, modifiedDone, anchor.modified}, runs_, budget);
    appendRun(runs_, {anchor.original, anchor.modified, 1});
    originalDone = anchor.original + 1;
    modifiedDone = anchor.modified + 1;
  }
  shortestEdit_.appendRuns({originalDone, static_cast<std::uint32_t>(original_.size()), modifiedDone,
                            static_cast<std::uint32_t>(modified_.size())},
                           runs_, budget);

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
  match(static_cast<std::uint32_t>(original.size()), static_cast<std::uint32_t>(modified.size()));
  return changes_;
}

}  // namespace MarletDiff
