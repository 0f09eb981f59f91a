#include "MarletFoundation/DiffPack/FieldwiseDiff.h"

#include <algorithm>

#include "MarletDiff/ContentDiff.h"
#include "MarletFoundation/SourceAnnotations/EditableRanges.h"
#include "MarletFoundation/SourceAnnotations/TagScanner.h"

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

/// Ranges in order, of overlapping ones what each adds to those before; those of negative length hold nothing.
std::vector<TextRange> separated(std::vector<TextRange> ranges) {
  std::sort(ranges.begin(), ranges.end(), [](const TextRange& a, const TextRange& b) {
    return std::pair(a.location, -a.length) < std::pair(b.location, -b.length);
  });
  std::vector<TextRange> result;
  std::int64_t end = -1;
  for (const auto& range : ranges) {
    if (range.length < 0 || range.end() <= end) continue;
    const auto start = std::max(range.location, end);
    result.push_back({start, range.end() - start});
    end = range.end();
  }
  return result;
}

/// What is left of ranges when the tags are cut out of them; both are in order and overlap nowhere. Empty pieces are
/// places to insert at, unless another piece ends there.
std::vector<TextRange> cutAtTags(const std::vector<TextRange>& ranges, const std::vector<TextRange>& tags) {
  std::vector<TextRange> pieces;
  const auto add = [&](std::int64_t start, std::int64_t end) {
    const bool isEndOfLast = start == end && !pieces.empty() && pieces.back().end() == start;
    if (start <= end && !isEndOfLast) pieces.push_back({start, end - start});
  };
  auto tag = tags.begin();
  for (const auto& range : ranges) {
    auto start = range.location;
    while (tag != tags.end() && tag->end() <= start) ++tag;
    for (; tag != tags.end() && tag->location < range.end(); ++tag) {
      add(start, tag->location);
      start = tag->end();
      if (start > range.end()) break;
    }
    add(start, range.end());
  }
  return pieces;
}

std::u16string_view part(std::u16string_view text, std::int64_t start, std::int64_t end) {
  return text.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(end - start));
}

/// The changes within each of the pieces; nothing when what lies between them doesn't stand in `edited` as it was.
std::optional<std::vector<DiffDescriptor>> piecewiseDiff(std::u16string_view original,
                                                         std::u16string_view edited,
                                                         const std::vector<TextRange>& pieces) {
  if (pieces.empty()) return std::nullopt;
  const auto head = part(original, 0, pieces.front().location);
  const auto tail = part(original, pieces.back().end(), std::ssize(original));
  if (head.size() + tail.size() > edited.size() || !edited.starts_with(head) || !edited.ends_with(tail))
    return std::nullopt;
  const auto editedEnd = std::ssize(edited) - std::ssize(tail);

  std::vector<DiffDescriptor> hunks;
  auto budget = MarletDiff::diffBudget(original.size() + edited.size());
  auto at = std::ssize(head);
  for (std::size_t i = 0; i < pieces.size(); ++i) {
    const auto& piece = pieces[i];
    const auto rest = part(edited, at, editedEnd);
    const auto behind = i + 1 < pieces.size() ? part(original, piece.end(), pieces[i + 1].location) : u"";
    const auto length = i + 1 < pieces.size() ? firstPlace(rest, behind) : rest.size();
    if (length == rest.npos) return std::nullopt;
    for (auto& hunk :
         MarletDiff::diffContent(part(original, piece.location, piece.end()), rest.substr(0, length),
                                 MarletDiff::DiffOptions::SmallerHunks, budget)) {
      hunk.originalRange.location += piece.location;
      hunk.modifiedRange.location += at;
      hunks.push_back(std::move(hunk));
    }
    at += static_cast<std::int64_t>(length + behind.size());
  }
  return hunks;
}

/// A line tag's whole line, its end included; an inline tag with the quote beside it that belongs to it.
TextRange placeOf(const SourceTag::Located& located, const LineUnit& unit) {
  if (located.tag.isLineTag()) return {unit.location, unit.enclosingEnd - unit.location};
  auto place = located.range;
  if (const auto* start = std::get_if<SourceTag::InlineFieldStart>(&located.tag.payload)) {
    place.length += start->inset;
  } else if (const auto* end = std::get_if<SourceTag::InlineFieldEnd>(&located.tag.payload)) {
    place.location -= end->inset;
    place.length += end->inset;
  }
  return place;
}

/// Where the tags stand that mark what may be edited, in order.
std::vector<TextRange> tagPlaces(std::u16string_view text) {
  std::vector<TextRange> places;
  SourceTag::ParseResult scanned;
  forEachUnitWithCandidates(text, [&](const LineUnit& unit) {
    scanned.tags.clear();
    scanned.errors.clear();
    scanUnit(unit, scanned);
    for (const auto& located : scanned.tags) {
      if (!located.tag.isCopyDestination()) places.push_back(placeOf(located, unit));
    }
  });
  return separated(std::move(places));
}

}  // namespace

std::vector<DiffDescriptor> hunksBesideTags(const MarletDiff::DiffDescriptors& hunks,
                                            std::u16string_view text) {
  const auto tags = tagPlaces(text);
  std::vector<DiffDescriptor> kept;
  std::copy_if(hunks.begin(), hunks.end(), std::back_inserter(kept), [&](const DiffDescriptor& hunk) {
    const auto& range = hunk.originalRange;
    const auto tag = std::partition_point(
        tags.begin(), tags.end(), [&](const TextRange& place) { return place.end() <= range.location; });
    return tag == tags.end() || range.end() <= tag->location;
  });
  return kept;
}

std::optional<std::vector<DiffDescriptor>> fieldwiseDiff(std::u16string_view original,
                                                         std::u16string_view edited) {
  const auto tags = tagPlaces(original);
  auto byField = piecewiseDiff(original, edited, cutAtTags(separated(editableRanges(original)), tags));
  return byField ? byField : piecewiseDiff(original, edited, cutAtTags({{0, std::ssize(original)}}, tags));
}

}  // namespace MarletFoundation
