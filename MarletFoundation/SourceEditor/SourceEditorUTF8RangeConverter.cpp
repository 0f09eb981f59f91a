#include "MarletFoundation/SourceEditor/SourceEditorUTF8RangeConverter.h"

namespace MarletFoundation {

// The lower bound is converted first, so that the upper one goes on from it.

SourceEditorRange SourceEditorUTF8RangeConverter::sourceEditorRangeFromRange(const OffsetRange& range) {
  const auto lower = utf8_.utf16IndexFromUTF8Index(range.lowerBound);
  return utf16RangeConverter_.sourceEditorRangeFromRange(
      {lower, utf8_.utf16IndexFromUTF8Index(range.upperBound)});
}

OffsetRange SourceEditorUTF8RangeConverter::rangeFromSourceEditorRange(const SourceEditorRange& range) {
  const auto units = utf16RangeConverter_.rangeFromSourceEditorRange(range);
  const auto lower = utf8_.utf8IndexFromUTF16Index(units.lowerBound);
  return {lower, utf8_.utf8IndexFromUTF16Index(units.upperBound)};
}

SourceEditorPosition SourceEditorUTF8RangeConverter::sourceEditorPositionFromIndex(std::int64_t index) {
  return utf16RangeConverter_.sourceEditorPositionFromIndex(utf8_.utf16IndexFromUTF8Index(index));
}

std::int64_t SourceEditorUTF8RangeConverter::indexFromSourceEditorPosition(
    const SourceEditorPosition& position) {
  return utf8_.utf8IndexFromUTF16Index(utf16RangeConverter_.indexFromSourceEditorPosition(position));
}

}  // namespace MarletFoundation
