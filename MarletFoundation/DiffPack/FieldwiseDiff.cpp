#include "MarletFoundation/DiffPack/FieldwiseDiff.h"

#include <algorithm>

#include "MarletDiff/ContentDiff.h"
#include "MarletFoundation/SourceAnnotations/EditableRanges.h"

namespace MarletFoundation {
namespace {

using MarletDiff::DiffDescriptor;

/// Where `part` stands first in `text`, in linear time for any texts.
std::size_t firstPlace(std::u16string_view text, std::u16string_view part) {
  if (part.empty()) return 0;
  // How much of the part both starts and ends each of its prefixes.
  std::vector<std::size_t> borders(part.size() + 1);
  const auto matchedWith = [&](char16_t unit, std::size_t matched) {
    while (matched > 0 && part[matched] != unit) matched = borders[matched];
    return part[matched] == unit ? matched + 1 : 0;
  };
  for (std::size_t i = 1; i < part.size(); ++i) borders[i + 1] = matchedWith(part[i], borders[i]);
  std::size_t matched = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    matched = matchedWith(text[i], matched);
    if (matched == part.size()) return i + 1 - matched;
  }
  return text.npos;
}

/// The ranges in order, without those of negative length and those that overlap one before.
std::vector<TextRange> separateRanges(std::u16string_view text) {
  auto ranges = editableRanges(text);
  std::sort(ranges.begin(), ranges.end(),
            [](const TextRange& a, const TextRange& b) { return a.location < b.location; });
  std::int64_t end = 0;
  std::erase_if(ranges, [&](const TextRange& range) {
    if (range.length < 0 || range.location < end) return true;
    end = range.end();
    return false;
  });
  return ranges;
}

std::u16string_view part(std::u16string_view text, std::int64_t start, std::int64_t end) {
  return text.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(end - start));
}

}  // namespace

std::optional<std::vector<DiffDescriptor>> fieldwiseDiff(std::u16string_view original,
                                                         std::u16string_view edited) {
  const auto ranges = separateRanges(original);
  if (ranges.empty()) return std::nullopt;
  const auto head = part(original, 0, ranges.front().location);
  const auto tail = part(original, ranges.back().end(), std::ssize(original));
  if (head.size() + tail.size() > edited.size() || !edited.starts_with(head) || !edited.ends_with(tail))
    return std::nullopt;
  const auto editedEnd = std::ssize(edited) - std::ssize(tail);

  std::vector<DiffDescriptor> hunks;
  auto at = std::ssize(head);
  for (std::size_t i = 0; i < ranges.size(); ++i) {
    const auto& range = ranges[i];
    const auto rest = part(edited, at, editedEnd);
    const auto behind = i + 1 < ranges.size() ? part(original, range.end(), ranges[i + 1].location) : u"";
    const auto length = i + 1 < ranges.size() ? firstPlace(rest, behind) : rest.size();
    if (length == rest.npos) return std::nullopt;
    for (auto& hunk :
         MarletDiff::diffContent(part(original, range.location, range.end()), rest.substr(0, length),
                                 MarletDiff::DiffOptions::SmallerHunks)) {
      hunk.originalRange.location += range.location;
      hunk.modifiedRange.location += at;
      hunks.push_back(std::move(hunk));
    }
    at += static_cast<std::int64_t>(length + behind.size());
  }
  return hunks;
}

}  // namespace MarletFoundation
