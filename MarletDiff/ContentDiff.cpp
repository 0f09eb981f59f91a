#include "MarletDiff/ContentDiff.h"

#include "MarletDiff/Comparison.h"

namespace MarletDiff {
namespace {

/// A stretch of either text, by offsets.
struct Change {
  std::size_t original;
  std::size_t originalEnd;
  std::size_t modified;
  std::size_t modifiedEnd;
};

DiffDescriptor descriptor(std::u16string_view original, std::u16string_view modified, const Change& change) {
  const auto range = [](std::size_t start, std::size_t end) {
    return MarletFoundation::TextRange{static_cast<std::int64_t>(start),
                                       static_cast<std::int64_t>(end - start)};
  };
  return {range(change.original, change.originalEnd), range(change.modified, change.modifiedEnd),
          std::u16string(original.substr(change.original, change.originalEnd - change.original)),
          std::u16string(modified.substr(change.modified, change.modifiedEnd - change.modified))};
}

/// The changes between the parts of two texts that `within` names, token by token.
std::vector<Change> changesWithin(const Change& within, std::u16string_view original,
                                  std::u16string_view modified, Tokens (*cut)(std::u16string_view),
                                  std::int64_t& budget) {
  const auto a = cut(original.substr(within.original, within.originalEnd - within.original));
  const auto b = cut(modified.substr(within.modified, within.modifiedEnd - within.modified));
  std::vector<Change> result;
  for (const auto& change : changes(a, b, budget)) {
    result.push_back(
        {within.original + a.start(change.original), within.original + a.start(change.originalEnd),
         within.modified + b.start(change.modified), within.modified + b.start(change.modifiedEnd)});
  }
  return result;
}

}  // namespace

std::vector<DiffDescriptor> diffContent(std::u16string_view original, std::u16string_view modified,
                                        std::optional<DiffOptions> options) {
  const bool smaller = options && options->contains(DiffOptions::SmallerHunks);
  // One budget for the whole call, so that many hunks can't add up to more than it.
  std::int64_t budget =
      (std::int64_t{1} << 24) + 16 * static_cast<std::int64_t>(original.size() + modified.size());

  std::vector<DiffDescriptor> hunks;
  const Change whole{0, original.size(), 0, modified.size()};
  for (const auto& lines : changesWithin(whole, original, modified, Tokens::lines, budget)) {
    if (!smaller || lines.original == lines.originalEnd || lines.modified == lines.modifiedEnd) {
      hunks.push_back(descriptor(original, modified, lines));
      continue;
    }
    for (const auto& words : changesWithin(lines, original, modified, Tokens::words, budget)) {
      hunks.push_back(descriptor(original, modified, words));
    }
  }
  return hunks;
}

}  // namespace MarletDiff
