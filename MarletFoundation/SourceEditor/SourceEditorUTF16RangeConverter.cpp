#include "MarletFoundation/SourceEditor/SourceEditorUTF16RangeConverter.h"

namespace MarletFoundation {

std::shared_ptr<const SourceEditorBuffer> SourceEditorUTF16RangeConverter::buffer() const {
  auto buffer = buffer_.lock();
  if (!buffer) fatalError("the buffer of a range converter is gone");
  return buffer;
}

SourceEditorRange SourceEditorUTF16RangeConverter::sourceEditorRangeFromRange(const OffsetRange& range) {
  const auto text = buffer();
  const auto start = text->positionFromIndex(range.lowerBound, lastLine_);
  const auto end = text->positionFromIndex(range.upperBound, start.line);
  lastLine_ = end.line;
  return {start, end};
}

OffsetRange SourceEditorUTF16RangeConverter::rangeFromSourceEditorRange(
    const SourceEditorRange& range) const {
  const auto text = buffer();
  const auto lower = text->indexFromPosition(range.start);
  return {lower, text->indexFromPosition(range.end)};
}

SourceEditorPosition SourceEditorUTF16RangeConverter::sourceEditorPositionFromIndex(
    std::int64_t index) const {
  return buffer()->positionFromIndex(index, lastLine_);
}

std::int64_t SourceEditorUTF16RangeConverter::indexFromSourceEditorPosition(
    const SourceEditorPosition& position) const {
  return buffer()->indexFromPosition(position);
}

}  // namespace MarletFoundation
