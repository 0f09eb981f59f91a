#pragma once

#include "MarletFoundation/SourceEditor/SourceEditorUTF16RangeConverter.h"
#include "MarletFoundation/SourceEditor/UTF8RangeConverter.h"

namespace MarletFoundation {

/// Converts between offsets in UTF-8 and positions of a buffer, by the rules of `UTF8RangeConverter` for
/// offsets and of `SourceEditorUTF16RangeConverter` for the buffer. It describes the buffer's text of the
/// moment in which it was made; after an edit a new one must be made. Sort what is converted: ascending order
/// costs one pass over the text. A value: a copy has caches of its own.
class MARLET_EXPORT SourceEditorUTF8RangeConverter {
 public:
  explicit SourceEditorUTF8RangeConverter(const std::shared_ptr<const SourceEditorBuffer>& buffer)
      : utf16RangeConverter_(buffer), utf8_(buffer->text()) {}

  SourceEditorRange sourceEditorRangeFromRange(const OffsetRange& range);
  /// Fatal for a range whose end lies in front of its start.
  OffsetRange rangeFromSourceEditorRange(const SourceEditorRange& range);
  SourceEditorPosition sourceEditorPositionFromIndex(std::int64_t index);
  std::int64_t indexFromSourceEditorPosition(const SourceEditorPosition& position);

  const SourceEditorUTF16RangeConverter& utf16RangeConverter() const { return utf16RangeConverter_; }
  const ConvertedIndex& lastConversion() const { return utf8_.lastConversion(); }
  const SharedText& string() const { return utf8_.string(); }
  /// Length of the text in UTF-16 units.
  std::int64_t endIndex() const { return utf8_.endIndex(); }

 private:
  SourceEditorUTF16RangeConverter utf16RangeConverter_;
  UTF8RangeConverter utf8_;
};

}  // namespace MarletFoundation
