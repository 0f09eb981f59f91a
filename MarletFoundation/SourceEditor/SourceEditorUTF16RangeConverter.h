#pragma once

#include "MarletFoundation/SourceEditor/OffsetRange.h"
#include "MarletFoundation/SourceEditor/SourceEditorBuffer.h"
#include "MarletFoundation/SourceEditor/SourceEditorRange.h"

namespace MarletFoundation {

/// Converts between offsets in UTF-16 units and positions of a buffer. The buffer must outlive it: a use
/// after the buffer is gone is fatal. A value: a copy remembers its line by itself.
class MARLET_EXPORT SourceEditorUTF16RangeConverter {
 public:
  explicit SourceEditorUTF16RangeConverter(const std::shared_ptr<const SourceEditorBuffer>& buffer)
      : buffer_(buffer) {}

  /// Remembers the line of the range's end, at which the next look-up starts; so ranges in ascending order
  /// are found fastest.
  SourceEditorRange sourceEditorRangeFromRange(const OffsetRange& range);
  /// Fatal for a range whose end lies in front of its start.
  OffsetRange rangeFromSourceEditorRange(const SourceEditorRange& range) const;
  SourceEditorPosition sourceEditorPositionFromIndex(std::int64_t index) const;
  std::int64_t indexFromSourceEditorPosition(const SourceEditorPosition& position) const;

  /// The line of the end of the most recent range; 0 before the first.
  std::int64_t lastLine() const { return lastLine_; }

 private:
  std::shared_ptr<const SourceEditorBuffer> buffer() const;

  std::weak_ptr<const SourceEditorBuffer> buffer_;
  std::int64_t lastLine_ = 0;
};

}  // namespace MarletFoundation
