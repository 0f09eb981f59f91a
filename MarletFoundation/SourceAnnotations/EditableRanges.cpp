#include "MarletFoundation/SourceAnnotations/EditableRanges.h"

#include <algorithm>

#include "MarletFoundation/SourceAnnotations/TagScanner.h"

namespace MarletFoundation {
namespace {

using Case = SourceTag::Case;

TextRange between(std::int64_t start, std::int64_t end) { return {start, end - start}; }

struct Regions {
  /// Both in the order of the tags that end them, so that their ends never go back.
  std::vector<TextRange> editable;
  std::vector<TextRange> hidden;
  /// Behind the last tag that begins or ends a region.
  std::int64_t start = 0;

  explicit Regions(std::u16string_view content) {
    SourceTag::ParseResult scanned;
    forEachUnitWithCandidates(content, [&](const LineUnit& unit) {
      scanned.tags.clear();
      scanned.errors.clear();
      scanUnit(unit, scanned);
      for (const auto& located : scanned.tags) add(located, unit);
    });
  }

 private:
  void add(const SourceTag::Located& located, const LineUnit& unit) {
    switch (located.tag.kind()) {
      case Case::multiLineFieldStart:
        start = unit.enclosingEnd;
        break;
      case Case::multiLineFieldEnd:
        editable.push_back(between(start, unit.location));
        start = unit.location;
        break;
      case Case::inlineFieldStart:
        start = located.range.end() + std::get<SourceTag::InlineFieldStart>(located.tag.payload).inset;
        break;
      case Case::inlineFieldEnd:
        editable.push_back(between(
            start, located.range.location - std::get<SourceTag::InlineFieldEnd>(located.tag.payload).inset));
        break;
      case Case::hiddenCodeStart:
        start = unit.location;
        break;
      case Case::hiddenCodeEnd:
        hidden.push_back(between(start, unit.enclosingEnd));
        start = unit.enclosingEnd;
        break;
      case Case::multiLineCopySourceStart:
      case Case::multiLineCopySourceEnd:
        hidden.push_back(between(unit.location, unit.enclosingEnd));
        break;
      case Case::codeCompletionDirective:
        hidden.push_back(between(unit.location, unit.enclosingEnd));
        start = unit.enclosingEnd;
        break;
      default:
        break;
    }
  }
};

std::vector<TextRange> gaps(const std::vector<TextRange>& hidden, std::int64_t end) {
  std::vector<TextRange> result;
  std::int64_t cursor = 0;
  for (const auto& range : hidden) {
    result.push_back(between(cursor, range.location));
    cursor = range.end();
  }
  result.push_back(between(cursor, end));
  return result;
}

bool overlap(const TextRange& a, const TextRange& b) {
  return std::max(a.location, b.location) < std::min(a.end(), b.end());
}

/// An editable range and what is left of it, last piece first: cuts come in the order of their ends, so that
/// they find their piece at the back.
struct CutRange {
  TextRange whole;
  std::vector<TextRange> pieces{whole};

  bool cut(const TextRange& hidden) {
    const auto found = std::find_if(pieces.rbegin(), pieces.rend(),
                                    [&](const TextRange& piece) { return overlap(piece, hidden); });
    if (found == pieces.rend()) return false;
    const auto piece = *found;
    auto place = pieces.erase(std::next(found).base());
    if (piece.end() > hidden.end()) place = pieces.insert(place, between(hidden.end(), piece.end()));
    if (piece.location < hidden.location) pieces.insert(place, between(piece.location, hidden.location));
    return true;
  }
};

/// Each hidden range cuts the first editable range of the list that it overlaps, and none but that; the part
/// behind the cut goes in front of the part before it.
std::vector<TextRange> cut(const std::vector<TextRange>& editable, const std::vector<TextRange>& hidden) {
  std::vector<CutRange> ranges;
  ranges.reserve(editable.size());
  for (const auto& range : editable) ranges.push_back({range});
  for (const auto& range : hidden) {
    auto candidate = std::partition_point(ranges.begin(), ranges.end(), [&](const CutRange& other) {
      return other.whole.end() <= range.location;
    });
    while (candidate != ranges.end() && candidate->whole.location < range.end() && !candidate->cut(range))
      ++candidate;
  }
  std::vector<TextRange> result;
  for (const auto& range : ranges) result.insert(result.end(), range.pieces.rbegin(), range.pieces.rend());
  return result;
}

}  // namespace

std::vector<TextRange> editableRanges(std::u16string_view content) {
  const Regions regions(content);
  const auto end = static_cast<std::int64_t>(content.size());
  if (regions.editable.empty() && !regions.hidden.empty()) return gaps(regions.hidden, end);
  auto ranges = cut(regions.editable, regions.hidden);
  if (ranges.empty()) ranges.push_back(between(regions.start, end));
  return ranges;
}

}  // namespace MarletFoundation
